#pragma once

#include <array>
#include <cstddef>
#include <optional>
#include <string>

#include "platform/host/log/LogEntry.h"
#include "platform/oslog_store.h"

namespace host {

/// The event that an entry of a log stands for.
///
/// Each part comes from a field, or from the next one in its line where the entry has no such
/// field. A number that cannot be read, and an offset of more than a day, count as no field; a
/// field that is there counts even when it is empty.
///
/// - type: LOG_TYPE, 1024
/// - date: the entry's; time zone: LOG_GMTOFF (seconds), this machine's local zone
/// - thread: TID, _PID, 0; activity: LOG_ACTIVITY, 0; process identifier: _PID, SYSLOG_PID, 0
/// - process: _COMM (without journald's escapes, whole by way of _EXE), SYSLOG_IDENTIFIER
/// - path of the image that logged: LOG_SENDER_PATH, _EXE; sender: its file name, the process
/// - subsystem: LOG_SUBSYSTEM, _SYSTEMD_UNIT, _TRANSPORT; category: LOG_CATEGORY,
///   SYSLOG_IDENTIFIER
/// - message: MESSAGE
///
/// An event is a view of an entry, which may change under it: it reports what the entry holds
/// when it is asked. Texts are valid until the entry changes or the same text is asked for again.
class LogEvent final : public OSLogEventProxy {
 public:
  explicit LogEvent(const LogEntry& shown) : entry(shown) {}

  std::uint32_t type() const override;
  OSLogDate date() const override { return OSLogDate(entry.microseconds); }
  OSLogTimeZone timeZone() const override;
  std::uint64_t threadIdentifier() const override;
  std::uint64_t activityIdentifier() const override;
  std::int32_t processIdentifier() const override;
  std::string_view process() const override;
  std::string_view sender() const override;
  std::string_view subsystem() const override;
  std::string_view category() const override;
  std::string_view composedMessage() const override;

  std::string_view senderImagePath() const;

 private:
  enum class Text : std::uint8_t { process, sender, subsystem, category, message, path, count };

  std::string_view processBytes() const;
  std::string_view pathBytes() const;
  std::string_view utf8(Text which, std::string_view bytes) const;

  const LogEntry& entry;
  mutable std::string name;  ///< an unescaped one
  mutable std::array<std::string, static_cast<std::size_t>(Text::count)> repaired;
};

}  // namespace host
