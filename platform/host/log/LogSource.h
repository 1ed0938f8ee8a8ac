#pragma once

#include <memory>
#include <string>

#include "platform/host/log/EntryReader.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/StopSignal.h"
#include "platform/oslog_store.h"

namespace host {

/// A log that has been prepared. Threads: any.
class LogSource : public OSLogEventSource {
 public:
  /// Returns a reader of the log, from its start or from a point before `from`. It may leave out
  /// entries that `filter` does not let pass. `stop` stops it. This source, `filter` and `stop`
  /// must outlive it, and it belongs to the calling thread. Throws an exception whose text is the
  /// reason when the log cannot be read.
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
