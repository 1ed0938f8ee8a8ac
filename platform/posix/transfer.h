#pragma once

#include <cstddef>
#include <string_view>
#include <system_error>

/// read(2) and write(2) for descriptors that may be shared with other programs, which may have made
/// them not block: those are waited for, without end and without changing them.
namespace posix {

/// Writes all of `bytes`: in one system call where the system takes them so, and what a short write
/// leaves after it. Returns what went wrong, if anything did; how much was written then is not
/// known.
[[nodiscard]] std::error_code writeAll(int descriptor, std::string_view bytes);

/// Reads at most `size` bytes into `buffer` and returns how many, 0 at the end of the input. An
/// error counts as its end.
[[nodiscard]] std::size_t readSome(int descriptor, char* buffer, std::size_t size);

}  // namespace posix
