#include "platform/host/log/LogEvent.h"

#include <charconv>
#include <optional>

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

OSLogTimeZone timeZoneOf(const LogEntry& entry) {
  const auto offset = number<std::int32_t>(entry, Field::gmtOffset);
  const bool sound = offset && *offset >= -kSecondsADay && *offset <= kSecondsADay;
  return sound ? OSLogTimeZone(*offset) : OSLogTimeZone();
}

}  // namespace

LogEvent::LogEvent(const LogEntry& entry, std::string& storage)
    : thread(number<std::uint64_t>(entry, Field::tid, Field::pid).value_or(0)),
      activity(number<std::uint64_t>(entry, Field::activity).value_or(0)),
      moment(entry.microseconds),
      zone(timeZoneOf(entry)),
      kind(number<std::uint32_t>(entry, Field::type).value_or(kOSLogEventTypeLogMessage)),
      pid(number<std::int32_t>(entry, Field::pid, Field::syslogPid).value_or(0)),
      texts(&storage) {
  const std::string process = processOf(entry);
  const std::string_view image = fileName(imagePathOf(entry));
  const std::array<std::string_view, kTexts> parts = {
      process, image.empty() ? process : image,
      firstOf(entry, Field::subsystem, Field::systemdUnit, Field::transport),
      firstOf(entry, Field::category, Field::syslogIdentifier), entry[Field::message]};
  std::string repaired;
  for (std::size_t i = 0; i < kTexts; ++i) {
    starts[i] = storage.size();
    storage += posix::asUtf8(parts[i], repaired);
  }
  starts[kTexts] = storage.size();
}

std::string processOf(const LogEntry& entry) {
  std::string name;
  std::string_view bytes = entry[Field::syslogIdentifier];
  if (entry.has(Field::comm)) {
    bytes = processName(unescaped(entry[Field::comm], name), entry[Field::exe]);
  }
  std::string repaired;
  return std::string(posix::asUtf8(bytes, repaired));
}

std::string_view imagePathOf(const LogEntry& entry) {
  return firstOf(entry, Field::senderPath, Field::exe);
}

}  // namespace host
