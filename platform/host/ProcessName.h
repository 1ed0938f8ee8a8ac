#pragma once

#include <string>
#include <string_view>

namespace host {

/// The part of `path` after its last slash: all of it where there is none, nothing where the slash
/// ends it.
std::string_view fileName(std::string_view path);

/// The name of a process: `comm`, its name as the kernel keeps it, completed where the kernel has
/// cut it. The kernel keeps 15 bytes (proc(5)); where `comm` is that long and the file name of the
/// executable `exePath` starts with it, that file name is the name. The " (deleted)" that the
/// kernel adds to the path of a removed executable is not part of it.
///
/// Either may be empty. The result lies in one of the two.
std::string_view processName(std::string_view comm, std::string_view exePath);

/// The name itself of `escaped`, in which journald has written quotation marks, backslashes and
/// what is no printing ASCII as in C: two characters, or a backslash and three octal digits. Any
/// other backslash stands for itself. The result is `escaped` or lies in `storage`.
std::string_view unescaped(std::string_view escaped, std::string& storage);

}  // namespace host
