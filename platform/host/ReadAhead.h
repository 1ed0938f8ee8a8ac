#pragma once

#include <condition_variable>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

#include "platform/host/ByteSource.h"
#include "platform/host/EntryReader.h"

namespace host {

/// Reads a log on a thread of its own, a little ahead of whoever takes the entries: to read and to
/// use a log take about as long, and can be done at the same time.
///
/// Entries go over in batches. What has been read goes over before more is asked of the source, so
/// that no entry waits for one that comes later; and there are three batches in all, so that the
/// thread is never more than two ahead.
///
/// Threads: all members belong to one thread. Whoever destroys this before the end of the log has
/// seen to it that the source does not block: the destructor waits for the thread.
class ReadAhead {
 public:
  /// Whether an entry is to be handed over. It is called on the reading thread.
  using Wanted = std::function<bool(const LogEntry&)>;

  /// Throws `std::system_error` when the system has no thread for it. `source` must outlive this.
  ReadAhead(ByteSource& source, Wanted wanted);
  ReadAhead(const ReadAhead&) = delete;
  ReadAhead& operator=(const ReadAhead&) = delete;
  ~ReadAhead();

  /// As `EntryReader::next` and `EntryReader::entry`, for the entries that are wanted.
  EntryReader::Result next();
  const LogEntry& entry() const { return current; }

 private:
  class Source;

  struct Batch {
    std::vector<LogEntry> entries;  ///< their values lie in `bytes`, which does not grow
    std::vector<char> bytes;
    EntryReader::Result after = EntryReader::Result::entry;  ///< what follows the entries
  };

  void readLog(ByteSource& source, const Wanted& wanted);
  void add(const LogEntry& entry);
  void handOver();
  void takeOver();

  LogEntry current;
  Batch taken;            ///< the user's
  std::size_t given = 0;  ///< entries of it that have been given
  Batch filling;          ///< the reading thread's
  std::mutex mutex;       ///< of what follows
  std::condition_variable changed;
  Batch ready;
  bool isReady = false;
  bool abandoned = false;
  std::thread thread;
};

}  // namespace host
