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

void LogEntry::append(Field field, std::string_view piece) {
  Value& value = values[static_cast<std::size_t>(field)];
  if (!value.isThere) value = {true, bytes.size(), 0};
  bytes += piece;
  value.size += piece.size();
}

void LogEntry::clear() {
  constexpr std::size_t kHuge = std::size_t{256} << 10;
  values = {};
  bytes.clear();
  if (bytes.capacity() > kHuge) bytes.shrink_to_fit();
}

}  // namespace host
