#pragma once

#include <memory>
#include <string>
#include <string_view>

/// The name under which the program was invoked, without its folder. Owned by the C library, as
/// in getprogname(3) of the BSDs. Any thread.
extern "C" const char* getprogname();

namespace platform {

/// Runs the event loop of the main thread, the only one to call it, and serves the platform's
/// callbacks. In practice it does not return.
void runMainEventLoop();

/// Makes the standard streams safe to use, before anything else is opened and while there is one
/// thread: each that is closed becomes the null device, and a reader that goes away, or a limit to
/// a file's size, costs the output and not the process.
void openStandardStreams();

/// Sees to it that there is an empty file at `path`: makes one, or empties the one that is there.
/// What is no regular file (a device, a pipe) is left as it is. A failure is not reported: what
/// counts is whether the file can be opened then. Any thread.
void createEmptyFile(const std::string& path);

/// A file open for writing at its end; it closes when destroyed.
///
/// Threads: one at a time.
class FileHandle {
 public:
  /// Opens the existing file at `path`. Null when that is not possible, which includes a pipe that
  /// nobody reads, and what the device itself reads.
  static std::unique_ptr<FileHandle> openForAppending(const std::string& path);

  FileHandle() = default;
  FileHandle(const FileHandle&) = delete;
  FileHandle& operator=(const FileHandle&) = delete;
  virtual ~FileHandle() = default;

  /// Appends `bytes` in one system call, with nothing buffered. False when not all of them could
  /// be written; how many were is not known.
  [[nodiscard]] virtual bool write(std::string_view bytes) = 0;
};

/// Writes `message` to the system log's default log object at error level. Never to the terminal.
/// Any thread.
void logError(const std::string& message);

}  // namespace platform
