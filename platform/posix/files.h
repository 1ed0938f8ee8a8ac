#pragma once

#include <string>

namespace posix {

/// Whether the file at `path` is one that the device itself reads, and so none to write to. The
/// port defines it. Any thread.
bool isReadByDevice(const std::string& path);

}  // namespace posix
