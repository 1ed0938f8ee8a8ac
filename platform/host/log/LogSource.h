#pragma once

#include <chrono>
#include <memory>
#include <string>

#include "platform/host/log/ByteSource.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/StopSignal.h"
#include "platform/oslog_store.h"

namespace host {

/// A log that is there to be read. Threads: any.
class LogSource : public OSLogEventSource {
 public:
  /// The bytes of the log, from its start or from somewhere before `from`; entries that `filter`
  /// does not let pass may be left out. Reading them is stopped by `stop`, which must outlive them.
  /// Throws `std::system_error` when it cannot be begun.
  virtual std::unique_ptr<ByteSource> open(OSLogDate from, const EventFilter& filter,
                                           const StopSignal& stop) const = 0;
};

/// How long journalctl may take for its first answer.
inline constexpr std::chrono::milliseconds kJournalPatience = std::chrono::seconds(10);

/// Makes a log ready to be read. `log` is one of
/// - "sample": a handful of recent events that is built in;
/// - "journal": this machine's journal, as journalctl reads it. All its files must be readable;
/// - the path of a folder with journal files, of another machine for instance, read the same way.
///   What journalctl passes over in silence, such as bytes overwritten inside a file, is missing
///   in silence here as well; journalctl --verify finds it;
/// - the path of anything else: a recorded log. One that is no regular file, such as a pipe, can
///   be read once, and its end is the end of what writes to it.
///
/// Throws `std::runtime_error`, whose text says what is wrong and what can be done.
std::shared_ptr<LogSource> prepareLog(const std::string& log,
                                      std::chrono::milliseconds patience = kJournalPatience);

}  // namespace host
