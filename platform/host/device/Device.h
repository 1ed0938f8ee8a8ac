#pragma once

#include <string>

#include "platform/host/device/Profile.h"

/// The device that this library stands in for. There is one in a process.
namespace host {

/// The profile of the device. The first call reads the file that the environment variable
/// ZUB_DEVICE names, if it is set; when that fails it says why on standard error and ends the
/// process with status 255. Threads: any. A test may change the profile while nothing else runs.
Profile& device();

/// Writes `message` and a line end to standard error, with control characters as "\x1b". For what
/// is wrong with the profile or with a file that it names.
void complain(std::string_view message);

}  // namespace host
