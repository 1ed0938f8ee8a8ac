#pragma once

#include <optional>
#include <string>

#include "platform/host/device/Profile.h"
#include "platform/lumo.h"
#include "platform/zub_client.h"

/// What the simulated server and the simulated helper service have in common.
namespace host {

/// The dictionary of a request as the request log shows it: {Key="text", Other=1}, with \", \\ and
/// \n in texts.
std::string describe(const lumo::dict& request);

/// Appends `line` to the request log, if the device has one. Reports a failure on standard error.
void recordRequest(const std::string& line);

/// Answers a request: with the fault in `answer`, or with success and {`key`=`value`} in `*reply`.
/// An error does not change `*reply`.
TelephonyLumo::Result answerWith(const Answer& answer, std::string_view key, std::string value,
                                 lumo::object* reply);

/// Returns `given`, or the local time as "YYYY-MM-DD-HH-MM-SS-mmm".
std::string timestampOr(const std::optional<std::string>& given);

}  // namespace host
