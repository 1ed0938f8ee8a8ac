#pragma once

#include <sys/types.h>

#include <string>

#include "platform/posix/Descriptor.h"

namespace posix {

/// Whether the file at `path` is one that the device itself reads, and so none to write to. The
/// port defines it. Any thread.
bool isReadByDevice(const std::string& path);

/// Opens the file at `path` for writing at its end, and makes it with `mode` where there is none.
/// Never waits: a pipe that nobody reads is refused, and the descriptor does not block (see
/// transfer.h). None, and the reason in `errno`, when that is not possible. Any thread.
Descriptor openForAppending(const std::string& path, mode_t mode);

}  // namespace posix
