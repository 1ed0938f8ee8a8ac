#pragma once

#include <array>
#include <condition_variable>
#include <exception>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "platform/host/log/EntryReader.h"
#include "platform/host/log/LogEvent.h"
#include "platform/host/log/StopSignal.h"

namespace host {

/// Reads a log and decodes its events on a thread of its own, a little ahead of the thread that
/// takes them: the two take about as long.
///
/// Events are handed over in batches. The events at hand are handed over before the reader waits
/// for more of the log, so that no event waits for a later one. There are three batches, so the
/// thread is at most two ahead.
///
/// Threads: all members belong to one thread.
class ReadAhead {
 public:
  /// Makes the reader of the log. Called on the reading thread, to which the reader belongs.
  using Open = std::function<std::unique_ptr<EntryReader>()>;

  /// Whether the event of an entry is to be handed over. Called on the reading thread.
  using Wanted = std::function<bool(const LogEntry&)>;

  /// `stop` is what stops the reader, and must outlive this. Throws `std::system_error` when the
  /// system has no thread for it.
  ReadAhead(StopSignal& stop, Open open, Wanted wanted);
  ReadAhead(const ReadAhead&) = delete;
  ReadAhead& operator=(const ReadAhead&) = delete;

  /// Stops the reader and waits for the thread.
  ~ReadAhead();

  /// Goes on to the next event that is wanted. As `EntryReader::next`, with what it, `Open` or
  /// `Wanted` throws.
  bool next();

  /// The event of the last `next`, valid until the next call.
  const OSLogEventProxy& event() const { return taken->events[given - 1]; }

 private:
  struct Batch {
    std::vector<LogEvent> events;
    std::string texts;  ///< of the events

    bool last = false;  ///< no other follows: the log has ended, or failed, or was stopped
    std::exception_ptr failure;
  };

  void run(const Open& open, const Wanted& wanted);
  void add(const LogEntry& entry);
  void handOver();
  void takeOver();

  StopSignal& stopSignal;
  std::array<Batch, 3> batches;
  Batch* taken = batches.data();  ///< the user's
  std::size_t given = 0;          ///< events of it that have been given
  Batch* filling = &batches[1];   ///< the reading thread's
  std::mutex mutex;               ///< of what follows
  std::condition_variable changed;
  Batch* ready = &batches[2];
  bool isReady = false;
  bool abandoned = false;
  std::thread thread;
};

}  // namespace host
