#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <system_error>

/// The name under which the program was invoked, without its directory, as getprogname(3) of the
/// BSDs returns it. The C library owns it.
extern "C" const char* getprogname();

namespace platform {

/// Runs the platform's event loop on the main thread, the only one to call it, with all signals
/// blocked. In practice it does not return.
void runMainEventLoop();

/// Prepares the standard streams. Called once, before any other file is opened or thread started.
///
/// Opens the null device for each standard descriptor that is closed. Ignores SIGPIPE and SIGXFSZ:
/// output that nobody reads, or that exceeds the limit of a file's size, is lost, and the process
/// continues.
///
/// Gives std::cin, std::cout and std::cerr buffers of their own, apart from the C library's. They
/// wait while a descriptor that does not block is not ready. Both outputs are buffered until a
/// flush, and written with one system call where the buffer holds the text. Output that cannot be
/// written is dropped, and the stream stays good. Throws `std::bad_alloc`.
void openStandardStreams();

/// A file that is open for appending. The destructor closes it.
class FileHandle {
 public:
  /// Creates the file at `path`, with access for its owner alone, or truncates it. Opens a device
  /// or a pipe without changing it. Returns null on failure, and for a pipe that nobody reads, a
  /// file of a standard stream and one that the device reads; none is changed. Never waits.
  static std::unique_ptr<FileHandle> createEmpty(const std::string& path);

  virtual ~FileHandle() = default;

  /// Appends all of `bytes`, unbuffered, with one system call where the system takes them whole.
  /// Waits for a slow reader without a time-out. Returns the error, if any; it is then not known
  /// how much was written.
  [[nodiscard]] virtual std::error_code write(std::string_view bytes) = 0;
};

/// Writes `message` to the system log at error level, and never to the terminal.
void logError(const std::string& message);

}  // namespace platform
