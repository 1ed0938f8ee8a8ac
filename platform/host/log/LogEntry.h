#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace host {

/// The fields of an entry that an event is made of. All others are skipped.
enum class Field : std::uint8_t {
  realtimeTimestamp,
  gmtOffset,
  type,
  tid,
  pid,
  syslogPid,
  activity,
  comm,
  exe,
  syslogIdentifier,
  senderPath,
  subsystem,
  systemdUnit,
  transport,
  category,
  message,
  none  ///< not a field: their number
};

/// The field of that name; none for a name of no interest.
Field fieldCalled(std::string_view name);

/// The name of a field that is not none.
std::string_view nameOf(Field field);

// What an entry of any log may have. Fields that no event is made of have no limit to their size.
inline constexpr std::size_t kMaxField = std::size_t{32} << 20;    ///< the bytes of one field
inline constexpr std::size_t kMaxFields = std::size_t{64} << 20;   ///< those of all together
inline constexpr std::int64_t kMaxDate = 253'402'300'799'999'999;  ///< the end of the year 9999

/// One entry of a log: the first value of each field, as it stood there. The bytes may be any.
struct LogEntry {
  /// The date: microseconds since 1970, at most kMaxDate.
  std::int64_t microseconds = 0;

  bool has(Field field) const { return at(field).data() != nullptr; }
  std::string_view operator[](Field field) const { return at(field); }

  const std::string_view& at(Field field) const { return values[static_cast<std::size_t>(field)]; }
  std::string_view& at(Field field) { return values[static_cast<std::size_t>(field)]; }

  /// One value for each field; a field that the entry does not have is one without data.
  using Values = std::array<std::string_view, static_cast<std::size_t>(Field::none)>;

 private:
  Values values;
};

}  // namespace host
