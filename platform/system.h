#pragma once

#include <string>
#include <string_view>
#include <utility>

/// The name under which the program was invoked, without its folder. Owned by the C library, as
/// in getprogname(3) of the BSDs. Any thread.
extern "C" const char* getprogname();

namespace platform {

/// Runs the event loop of the main thread, the only one to call it, and serves the platform's
/// callbacks. In practice it does not return.
void runMainEventLoop();

/// Sees to it that there is an empty file at `path`: makes one, or empties the one that is there.
/// What is no regular file (a device, a pipe) is left as it is. A failure is not told: what counts
/// is whether the file can be opened then. Any thread.
void createEmptyFile(const std::string& path);

/// A file open for writing at its end. Move-only; closes when destroyed.
///
/// Threads: one at a time.
class FileHandle {
 public:
  /// Opens the existing file at `path`. The handle is empty when that is not possible, which
  /// includes a pipe that nobody reads, and the recorded log that the device itself reads.
  static FileHandle openForAppending(const std::string& path);

  FileHandle(FileHandle&& other) noexcept : descriptor(std::exchange(other.descriptor, -1)) {}
  FileHandle& operator=(FileHandle&& other) noexcept {
    std::swap(descriptor, other.descriptor);
    return *this;
  }
  ~FileHandle() { close(); }

  explicit operator bool() const noexcept { return descriptor >= 0; }

  /// Appends `bytes` in one system call, with nothing buffered. False when not all of them could
  /// be written; how many were is not told.
  bool write(std::string_view bytes);

  /// Closes the file. Nothing happens when it is closed already.
  void close() noexcept;

 private:
  explicit FileHandle(int opened) : descriptor(opened) {}
  int descriptor = -1;
};

/// Writes `message` to the system log's default log object at error level. Never to the terminal.
/// Any thread.
void logError(const std::string& message);

}  // namespace platform
