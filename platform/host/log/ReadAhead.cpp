#include "platform/host/log/ReadAhead.h"

#include <utility>

#include "platform/posix/Thread.h"

namespace host {
namespace {

constexpr std::size_t kBatchBytes = std::size_t{256} << 10;

}  // namespace

ReadAhead::ReadAhead(StopSignal& stop, Open open, Wanted wanted)
    : stopSignal(stop),
      thread(posix::startThread(
          [this, open = std::move(open), wanted = std::move(wanted)] { run(open, wanted); })) {}

ReadAhead::~ReadAhead() {
  stopSignal.raise();
  {
    const std::lock_guard lock(mutex);
    abandoned = true;
  }
  changed.notify_one();
  thread.join();
}

bool ReadAhead::next() {
  while (given == taken->events.size()) {
    if (taken->failure) std::rethrow_exception(taken->failure);
    if (taken->last) return false;
    takeOver();
  }
  ++given;
  return true;
}

void ReadAhead::run(const Open& open, const Wanted& wanted) {
  try {
    const auto reader = open();
    reader->callBeforeWaiting([this] {
      if (!filling->events.empty()) handOver();
    });
    while (reader->next()) {
      if (wanted(reader->entry())) add(reader->entry());
    }
  } catch (...) {
    filling->failure = std::current_exception();
  }
  filling->last = true;
  handOver();
}

void ReadAhead::add(const LogEntry& entry) {
  filling->events.emplace_back(entry, filling->texts);
  const std::size_t size = filling->events.size() * sizeof(LogEvent) + filling->texts.size();
  if (size >= kBatchBytes) handOver();
}

void ReadAhead::handOver() {
  {
    std::unique_lock lock(mutex);
    changed.wait(lock, [this] { return !isReady || abandoned; });
    std::swap(filling, ready);
    isReady = true;
  }
  changed.notify_one();
  filling->events.clear();
  filling->texts.clear();
  // What a huge event has taken is not kept.
  if (filling->texts.capacity() > 2 * kBatchBytes) filling->texts.shrink_to_fit();
}

void ReadAhead::takeOver() {
  {
    std::unique_lock lock(mutex);
    changed.wait(lock, [this] { return isReady; });
    std::swap(ready, taken);
    isReady = false;
  }
  changed.notify_one();
  given = 0;
}

}  // namespace host
