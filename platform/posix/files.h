#pragma once

#include <sys/types.h>

#include <string>

#include "platform/posix/Descriptor.h"

namespace posix {

/// Whether the file at `path` is one that the device itself reads, and so none to write to. The
/// port defines it.
bool isReadByDevice(const std::string& path);

/// Opens the file at `path` for writing at its end, and makes it with `mode` where there is none.
/// What the device reads is refused. Never waits: a pipe that nobody reads is refused as well, and
/// the descriptor does not block (see transfer.h). None, and the reason in `errno`, when that is
/// not possible.
Descriptor openForAppending(const std::string& path, mode_t mode);

}  // namespace posix
