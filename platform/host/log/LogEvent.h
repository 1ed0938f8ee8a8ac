#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "platform/host/log/LogEntry.h"
#include "platform/oslog_store.h"

namespace host {

/// The event that an entry of a log stands for, with all its parts decoded. It is independent of
/// the entry; its texts belong to whoever made it.
///
/// Each part comes from the first field in its line that the entry has, empty or not; a value
/// without a name is the default. A number that cannot be read, and an offset of more than a day,
/// count as no field.
///
/// - type: LOG_TYPE, 1024
/// - date: the entry's; time zone: LOG_GMTOFF (seconds), this machine's local zone
/// - thread: TID, _PID, 0; activity: LOG_ACTIVITY, 0; process identifier: _PID, SYSLOG_PID, 0
/// - process: as `processOf`; sender: file name of the image as `imagePathOf`, the process
/// - subsystem: LOG_SUBSYSTEM, _SYSTEMD_UNIT, _TRANSPORT; category: LOG_CATEGORY,
///   SYSLOG_IDENTIFIER
/// - message: MESSAGE
class LogEvent final : public OSLogEventProxy {
 public:
  /// Appends its texts to `storage`, which must outlive it, and may grow but not change.
  LogEvent(const LogEntry& entry, std::string& storage);

  std::uint32_t type() const override { return kind; }
  OSLogDate date() const override { return moment; }
  OSLogTimeZone timeZone() const override { return zone; }
  std::uint64_t threadIdentifier() const override { return thread; }
  std::uint64_t activityIdentifier() const override { return activity; }
  std::int32_t processIdentifier() const override { return pid; }
  std::string_view process() const override { return text(0); }
  std::string_view sender() const override { return text(1); }
  std::string_view subsystem() const override { return text(2); }
  std::string_view category() const override { return text(3); }
  std::string_view composedMessage() const override { return text(4); }

 private:
  static constexpr std::size_t kTexts = 5;
  std::string_view text(std::size_t index) const {
    const std::size_t start = starts[index];
    return std::string_view(*texts).substr(start, starts[index + 1] - start);
  }

  std::uint64_t thread;
  std::uint64_t activity;
  OSLogDate moment;
  OSLogTimeZone zone;
  std::uint32_t kind;
  std::int32_t pid;
  const std::string* texts;
  std::array<std::size_t, kTexts + 1> starts;  ///< of each text, one after the other, and the end
};

/// The name of the process that logged, as UTF-8: _COMM (without journald's escapes, whole by way
/// of _EXE), SYSLOG_IDENTIFIER.
std::string processOf(const LogEntry& entry);

/// The path of the image that logged, of any bytes: LOG_SENDER_PATH, _EXE. It is the entry's.
std::string_view imagePathOf(const LogEntry& entry);

}  // namespace host
