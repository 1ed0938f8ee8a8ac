#pragma once

#include "platform/host/device/Profile.h"

/// The device that this library simulates. A process has one.
namespace host {

/// The profile of the device. The first call reads the file that the environment variable
/// ZUB_DEVICE names, if it is set; when that fails it says why on standard error and ends the
/// process with status 255. Threads: any. A test may change the profile while nothing else runs.
Profile& device();

/// Writes `message` as a line to standard error, with control characters shown as "\x1b". For
/// faults of the profile and of the files that it names.
void complain(std::string_view message);

}  // namespace host
