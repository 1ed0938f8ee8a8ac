#include "platform/host/log/LogEvent.h"

#include <charconv>

#include "platform/host/ProcessName.h"
#include "platform/posix/Utf8.h"

namespace host {
namespace {

constexpr std::int32_t kSecondsADay = 86'400;

/// The first of `fields` that is a whole decimal number.
template <class Number, class... Fields>
std::optional<Number> number(const LogEntry& entry, Fields... fields) {
  for (const Field field : {fields...}) {
    const std::string_view text = entry[field];
    const char* const end = text.data() + text.size();
    Number value{};
    const auto [stop, error] = std::from_chars(text.data(), end, value);
    if (error == std::errc() && stop == end) return value;
  }
  return std::nullopt;
}

/// The first of `fields` that the entry has, or nothing.
template <class... Fields>
std::string_view firstOf(const LogEntry& entry, Fields... fields) {
  for (const Field field : {fields...}) {
    if (entry.has(field)) return entry[field];
  }
  return {};
}

}  // namespace

std::uint32_t LogEvent::type() const {
  return number<std::uint32_t>(entry, Field::type).value_or(kOSLogEventTypeLogMessage);
}

OSLogTimeZone LogEvent::timeZone() const {
  const auto offset = number<std::int32_t>(entry, Field::gmtOffset);
  const bool sound = offset && *offset >= -kSecondsADay && *offset <= kSecondsADay;
  return sound ? OSLogTimeZone(*offset) : OSLogTimeZone();
}

std::uint64_t LogEvent::threadIdentifier() const {
  return number<std::uint64_t>(entry, Field::tid, Field::pid).value_or(0);
}

std::uint64_t LogEvent::activityIdentifier() const {
  return number<std::uint64_t>(entry, Field::activity).value_or(0);
}

std::int32_t LogEvent::processIdentifier() const {
  return number<std::int32_t>(entry, Field::pid, Field::syslogPid).value_or(0);
}

std::string_view LogEvent::process() const { return utf8(Text::process, processBytes()); }

std::string_view LogEvent::sender() const {
  const std::string_view file = fileName(pathBytes());
  return utf8(Text::sender, file.empty() ? processBytes() : file);
}

std::string_view LogEvent::subsystem() const {
  return utf8(Text::subsystem,
              firstOf(entry, Field::subsystem, Field::systemdUnit, Field::transport));
}

std::string_view LogEvent::category() const {
  return utf8(Text::category, firstOf(entry, Field::category, Field::syslogIdentifier));
}

std::string_view LogEvent::composedMessage() const {
  return utf8(Text::message, entry[Field::message]);
}

std::string_view LogEvent::senderImagePath() const { return utf8(Text::path, pathBytes()); }

std::string_view LogEvent::processBytes() const {
  if (!entry.has(Field::comm)) return entry[Field::syslogIdentifier];
  return processName(unescaped(entry[Field::comm], name), entry[Field::exe]);
}

std::string_view LogEvent::pathBytes() const {
  return firstOf(entry, Field::senderPath, Field::exe);
}

std::string_view LogEvent::utf8(Text which, std::string_view bytes) const {
  return posix::asUtf8(bytes, repaired[static_cast<std::size_t>(which)]);
}

}  // namespace host
