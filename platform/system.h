#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <system_error>

/// The name under which the program was invoked, without its folder. Owned by the C library, as
/// in getprogname(3) of the BSDs.
extern "C" const char* getprogname();

namespace platform {

/// Runs the event loop of the main thread, the only one to call it, and serves the platform's
/// callbacks. Called with all signals blocked. In practice it does not return.
void runMainEventLoop();

/// Makes the standard streams safe to use, before anything else is opened and while there is one
/// thread: each that is closed becomes the null device, and a reader that goes away, or a limit to
/// a file's size, costs the output and not the process.
///
/// From then on std::cin, std::cout and std::cerr share nothing with the C library's streams. They
/// wait for a descriptor that does not block; what is written stays in a buffer until a flush, on
/// std::cerr as well, and goes out in one system call where it fits; what cannot be written is
/// dropped, and the stream goes on. Throws `std::bad_alloc`. Called once.
void openStandardStreams();

/// A file open for writing at its end; it closes when destroyed.
class FileHandle {
 public:
  /// Opens the file at `path` and empties it, or makes it, for its owner alone. A device or a pipe
  /// is opened as it is. Null when any of that is not possible, which includes a pipe that nobody
  /// reads, and what the device itself reads; such a file is left as it was. Never waits.
  static std::unique_ptr<FileHandle> createEmpty(const std::string& path);

  FileHandle() = default;
  FileHandle(const FileHandle&) = delete;
  FileHandle& operator=(const FileHandle&) = delete;
  virtual ~FileHandle() = default;

  /// Appends all of `bytes`, with nothing buffered, in one system call where the system takes them
  /// so. Waits for a reader that is slow, without end. Returns what went wrong, if anything did;
  /// how much was written then is not known.
  [[nodiscard]] virtual std::error_code write(std::string_view bytes) = 0;
};

/// Writes `message` to the system log's default log object at error level. Never to the terminal.
void logError(const std::string& message);

}  // namespace platform
