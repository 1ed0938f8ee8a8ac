#pragma once

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

/// What the kernel keeps of the name of a process.
std::string_view truncatedByKernel(std::string_view name);

}  // namespace host
