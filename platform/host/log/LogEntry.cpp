#include "platform/host/log/LogEntry.h"

#include <algorithm>

namespace host {
namespace {

constexpr std::array<std::string_view, static_cast<std::size_t>(Field::none)> kNames = {
    "__REALTIME_TIMESTAMP",
    "LOG_GMTOFF",
    "LOG_TYPE",
    "TID",
    "_PID",
    "SYSLOG_PID",
    "LOG_ACTIVITY",
    "_COMM",
    "_EXE",
    "SYSLOG_IDENTIFIER",
    "LOG_SENDER_PATH",
    "LOG_SUBSYSTEM",
    "_SYSTEMD_UNIT",
    "_TRANSPORT",
    "LOG_CATEGORY",
    "MESSAGE",
};

}  // namespace

Field fieldCalled(std::string_view name) {
  const auto* const found = std::ranges::find(kNames, name);
  return static_cast<Field>(found - kNames.begin());
}

std::string_view nameOf(Field field) { return kNames[static_cast<std::size_t>(field)]; }

}  // namespace host
