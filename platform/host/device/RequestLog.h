#pragma once

#include <string>

#include "platform/lumo.h"

/// The file in which the device records what is asked of it.
namespace host {

/// A request's dictionary as the request log shows it: {Key="text", Other=1}, with \", \\ and \n in
/// texts.
std::string describe(const lumo::dict& request);

/// Appends `line` to the device's request log, if it keeps one. When that fails it says why on
/// standard error, and the device goes on.
void recordRequest(const std::string& line);

}  // namespace host
