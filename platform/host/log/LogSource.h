#pragma once

#include <memory>
#include <string>

#include "platform/host/log/EntryReader.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/StopSignal.h"
#include "platform/oslog_store.h"

namespace host {

/// A log that is there to be read. Threads: any.
class LogSource : public OSLogEventSource {
 public:
  /// A reader of the log, from its start or from somewhere before `from`; entries that `filter`
  /// does not let pass may be left out. It is stopped by `stop`, which must outlive it as the
  /// filter must, and belongs to the thread that makes it. Throws `std::exception`, whose text
  /// says why, when the reading cannot be begun.
  virtual std::unique_ptr<EntryReader> open(OSLogDate from, const EventFilter& filter,
                                            const StopSignal& stop) const = 0;
};

/// Makes a log ready to be read. `log` is one of
/// - "sample": a handful of recent events that is built in;
/// - "journal": this machine's journal. All its files must be readable;
/// - the path of a folder with journal files, of another machine for instance, or of one such file;
/// - the path of anything else: a recorded log. One that is no regular file, such as a pipe, can
///   be read once, and its end is the end of what writes to it.
///
/// Throws `std::runtime_error`, whose text says what is wrong and what can be done.
std::shared_ptr<LogSource> prepareLog(const std::string& log);

}  // namespace host
