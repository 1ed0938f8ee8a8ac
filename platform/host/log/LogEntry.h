#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
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

/// One entry of a log: its date, and the first value of each field. The bytes may be any.
class LogEntry {
 public:
  /// The date: microseconds since 1970, at most kMaxDate.
  std::int64_t microseconds = 0;

  bool has(Field field) const { return at(field).isThere; }

  /// The value of `field`, empty where the entry does not have it. Valid until the entry changes.
  std::string_view operator[](Field field) const {
    return std::string_view(bytes).substr(at(field).start, at(field).size);
  }

  /// The bytes of all values.
  std::size_t size() const { return bytes.size(); }

  /// Appends `piece` to the value of `field`, which is the last that the entry got, or a new one.
  void append(Field field, std::string_view piece);

  /// Makes it one without fields. Gives back the memory of a huge one.
  void clear();

 private:
  struct Value {
    bool isThere = false;
    std::size_t start = 0;
    std::size_t size = 0;
  };
  const Value& at(Field field) const { return values[static_cast<std::size_t>(field)]; }

  std::array<Value, static_cast<std::size_t>(Field::none)> values;
  std::string bytes;  ///< of the values, one after the other
};

}  // namespace host
