#pragma once

#include <optional>
#include <string>

#include "platform/host/device/Profile.h"
#include "platform/lumo.h"
#include "platform/zub_client.h"

/// How the simulated server and the simulated helper service answer.
namespace host {

/// Answers a request as the profile says: `answer`'s fault if it is one, else success with
/// {`key`=`value`} in `*reply`. An error leaves `*reply` as it was.
TelephonyLumo::Result answerWith(const Answer& answer, std::string_view key, std::string value,
                                 lumo::object* reply);

/// The timestamp that the profile gives, or else the current local time to the millisecond, as
/// "YYYY-MM-DD-HH-MM-SS-mmm".
std::string timestampOr(const std::optional<std::string>& given);

}  // namespace host
