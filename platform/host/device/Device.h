#pragma once

#include <string>

#include "platform/host/device/Profile.h"

/// The device that this library stands in for. There is one in a process.
namespace host {

/// The device's profile. The first call reads the file that the environment variable ZUB_DEVICE
/// names, if it is set; when that is not possible it says why on standard error and ends the
/// process with status 255. Threads: any. A test may change the profile while nothing else runs.
Profile& device();

}  // namespace host
