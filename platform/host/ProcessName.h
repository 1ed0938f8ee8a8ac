#pragma once

#include <string>
#include <string_view>

namespace host {

/// The part of `path` after its last slash, or all of it when there is none.
std::string_view fileName(std::string_view path);

/// The name of a process. The kernel cuts `comm` after 15 bytes (proc(5)): when it is that long and
/// starts the file name of the executable `exePath`, that file name is the name. The " (deleted)"
/// that the kernel appends to the path of a removed executable is not part of it.
///
/// Either may be empty. The result refers to one of them.
std::string_view processName(std::string_view comm, std::string_view exePath);

/// The name that journald has written as `escaped`, with quotation marks, backslashes and all but
/// printable ASCII as escape sequences of C: two characters, or a backslash and three octal digits.
/// Any other backslash stands for itself. The result refers to `escaped` or `storage`.
std::string_view unescaped(std::string_view escaped, std::string& storage);

}  // namespace host
