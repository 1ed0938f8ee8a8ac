#pragma once

#include <compare>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/dispatch.h"

/// The streaming interface of the system log store.
///
/// A store is prepared and gives a source; a stream over that source delivers the events of the
/// log to a handler, in the order of the log, from a date on, until the log ends or the stream is
/// invalidated.

/// A point in absolute time, to the microsecond.
class OSLogDate {
 public:
  static OSLogDate now();

  explicit constexpr OSLogDate(std::int64_t microsecondsSince1970)
      : microseconds(microsecondsSince1970) {}

  /// This date plus `seconds`, which may be negative; cut to what a date can hold.
  OSLogDate addingSeconds(double seconds) const;

  constexpr std::int64_t microsecondsSince1970() const { return microseconds; }

  /// Appends the default text form, in GMT, to `text`: "YYYY-MM-DD HH:MM:SS +0000".
  void appendDescription(std::string& text) const;

  // NOLINTNEXTLINE(modernize-use-nullptr): takes the 0 of the comparison for a pointer
  friend constexpr auto operator<=>(const OSLogDate&, const OSLogDate&) = default;

 private:
  std::int64_t microseconds;
};

/// A time zone: a fixed offset, or this machine's local zone with its summer times. A change of the
/// local zone while the process runs need not be seen.
class OSLogTimeZone {
 public:
  /// The machine's local zone.
  OSLogTimeZone() = default;
  explicit OSLogTimeZone(std::int32_t fixedSecondsFromGMT) : fixed(fixedSecondsFromGMT) {}

  /// The offset from GMT in seconds, east positive, at that date.
  std::int32_t secondsFromGMT(OSLogDate date) const;

 private:
  std::optional<std::int32_t> fixed;
};

/// The type of an event that is a log message.
inline constexpr std::uint32_t kOSLogEventTypeLogMessage = 1024;

/// One event of the log. The store owns the event and its texts, which are valid until the event
/// handler returns. All texts are UTF-8.
class OSLogEventProxy {
 public:
  virtual ~OSLogEventProxy() = default;

  virtual std::uint32_t type() const = 0;
  virtual OSLogDate date() const = 0;
  virtual OSLogTimeZone timeZone() const = 0;  ///< of the device when the event was logged
  virtual std::uint64_t threadIdentifier() const = 0;
  virtual std::uint64_t activityIdentifier() const = 0;
  virtual std::int32_t processIdentifier() const = 0;
  virtual std::string_view process() const = 0;  ///< name of the logging process
  virtual std::string_view sender() const = 0;   ///< name of the image that logged
  virtual std::string_view subsystem() const = 0;
  virtual std::string_view category() const = 0;
  virtual std::string_view composedMessage() const = 0;  ///< with its arguments filled in
};

/// One simple test of an event: a format with the place "%@", and the value that goes there.
///
/// Formats that a store understands:
/// - "process == %@": the name of the logging process equals the value, byte for byte;
/// - "senderImagePath CONTAINS[cd] %@": the path of the image that logged contains the value,
///   ignoring case and diacritics. That covers ASCII and the Latin letters of U+00C0 to U+024F and
///   U+1E00 to U+1EFF, precomposed or followed by combining marks (U+0300 to U+036F), and takes
///   accents, strokes, hooks and tails for diacritics; all else is compared as it stands. A value
///   that is empty, or of nothing but combining marks, is contained in every path.
struct OSLogPredicate {
  std::string format;
  std::string value;
};

/// True for an event for which any of its terms is true.
struct OSLogOrPredicate {
  std::vector<OSLogPredicate> terms;
};

/// What a prepared store reads from. Opaque.
class OSLogEventSource {
 public:
  virtual ~OSLogEventSource() = default;
};

/// Where in the log a stream stood when it ended. Opaque.
class OSLogEventStreamPosition {};

/// The reason with which a stream ends at the end of the log.
inline constexpr unsigned long kOSLogEventStreamEndOfLog = 5;

/// Delivers the events of a source. It takes its settings before it is activated, and is activated
/// once.
///
/// Threads: the two handlers run on a thread of the store's own, one call at a time; it takes no
/// signals that are sent to the process. `invalidate` may be called from any thread, the handlers'
/// included, at any time and more than once; the other members belong to the thread that made the
/// stream. The stream may be released at any time; once activated it runs to its end all the same,
/// or to that of the process.
class OSLogEventStream {
 public:
  using EventHandler = dispatch::block<void(const OSLogEventProxy&)>;
  using InvalidationHandler =
      dispatch::block<void(unsigned long reason, const OSLogEventStreamPosition&)>;

  /// A new stream over `source`, or none when the system has no resources for it.
  static std::shared_ptr<OSLogEventStream> initWithSource(std::shared_ptr<OSLogEventSource> source);

  virtual ~OSLogEventStream() = default;

  /// A bit set of the store's own.
  virtual void setFlags(std::uint64_t flags) = 0;

  /// Only events for which `predicate` is true are delivered; without a filter all are. Throws
  /// `std::invalid_argument` for a format that the store does not understand.
  virtual void setFilterPredicate(OSLogOrPredicate predicate) = 0;

  virtual void setEventHandler(EventHandler handler) = 0;

  /// `handler` is called once, as the last act of a stream that has been activated: the event
  /// handler has been released by then.
  virtual void setInvalidationHandler(InvalidationHandler handler) = 0;

  /// Starts delivering the events of `date` and later, and returns at once. A stream that cannot
  /// be started ends at once, with its invalidation handler called before this returns.
  virtual void activateStreamFromDate(OSLogDate date) = 0;

  /// Asks the stream to stop, and returns at once. An event that is being handled, and one or more
  /// that follow it, may still arrive. A stream that is activated after this ends without events.
  virtual void invalidate() = 0;
};

/// A log store.
class OSLogEventStore {
 public:
  /// What `prepareWithCompletionHandler` reports: a source, or the description of an error.
  using PrepareHandler = dispatch::block<void(std::shared_ptr<OSLogEventSource> source,
                                              const std::optional<std::string>& error)>;

  /// The log store of this device.
  static std::shared_ptr<OSLogEventStore> localStore();

  virtual ~OSLogEventStore() = default;

  /// Makes the store ready to be read. `handler` runs once, before this returns.
  virtual void prepareWithCompletionHandler(PrepareHandler handler) = 0;
};
