#pragma once

#include <optional>
#include <string>

#include "platform/host/device/Profile.h"
#include "platform/lumo.h"
#include "platform/zub_client.h"

/// How the simulated server and the simulated helper service take requests.
namespace host {

/// A request's dictionary as the request log shows it: {Key="text", Other=1}, with \", \\ and \n in
/// texts.
std::string describe(const lumo::dict& request);

/// Appends `line` to the device's request log, if it keeps one. A failure is reported on standard
/// error, and the device goes on.
void recordRequest(const std::string& line);

/// Answers a request as the profile says: with the fault of `answer`, or else with success and
/// {`key`=`value`} in `*reply`. An error leaves `*reply` as it was.
TelephonyLumo::Result answerWith(const Answer& answer, std::string_view key, std::string value,
                                 lumo::object* reply);

/// The timestamp that the profile gives, or else the local time to the millisecond, as
/// "YYYY-MM-DD-HH-MM-SS-mmm".
std::string timestampOr(const std::optional<std::string>& given);

}  // namespace host
