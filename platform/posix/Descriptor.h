#pragma once

#include <sys/types.h>
#include <unistd.h>

#include <string>
#include <string_view>
#include <system_error>
#include <utility>

namespace posix {

/// Owns an open file descriptor, or none (-1). The destructor closes it.
class Descriptor {
 public:
  explicit Descriptor(int opened = -1) noexcept : number(opened) {}
  Descriptor(Descriptor&& other) noexcept : number(std::exchange(other.number, -1)) {}
  ~Descriptor() {
    if (number >= 0) ::close(number);
  }

  int get() const noexcept { return number; }

  /// Gives up the descriptor, which stays open.
  void release() noexcept { number = -1; }

  explicit operator bool() const noexcept { return number >= 0; }

 private:
  int number;
};

/// Whether the device itself reads the file at `path`, which then must not be written. The port
/// defines it.
bool isReadByDevice(const std::string& path);

/// Opens the file at `path` for writing at its end, or creates it with `mode`. The descriptor does
/// not block. Fails for a file that the device reads, and for a pipe that nobody reads: it never
/// waits. On failure it returns none, with the reason in `errno`.
Descriptor openForAppending(const std::string& path, mode_t mode);

// read(2) and write(2) for descriptors that may be shared with other programs, which may have made
// them not block. They wait until the descriptor is ready, without end and without changing it.

/// Writes all of `bytes`, with one system call where the system takes them whole; the rest of a
/// short write follows. Returns the error, if any: it is then not known how much was written.
[[nodiscard]] std::error_code writeAll(int descriptor, std::string_view bytes);

/// Reads at most `size` bytes into `buffer` and returns their number, 0 at the end of the input. An
/// error counts as the end.
[[nodiscard]] std::size_t readSome(int descriptor, char* buffer, std::size_t size);

/// How many writes the files of FileHandle have had. An export makes one for each line.
std::size_t linesWritten();

/// Called before anything is written to standard output or standard error through the streams, and
/// before a terminal is written to as a file. The port defines it.
void beforeOutput();

}  // namespace posix
