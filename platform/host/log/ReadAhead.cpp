#include "platform/host/log/ReadAhead.h"

#include <utility>

namespace host {
namespace {

constexpr std::size_t kBatchBytes = std::size_t{256} << 10;

}  // namespace

ReadAhead::ReadAhead(StopSignal& stop, Open open, Wanted wanted)
    : stopSignal(stop),
      thread([this, open = std::move(open), wanted = std::move(wanted)] { run(open, wanted); }) {}

ReadAhead::~ReadAhead() {
  stopSignal.raise();
  {
    const std::lock_guard lock(mutex);
    abandoned = true;
  }
  changed.notify_one();
  thread.join();
}

EntryReader::Result ReadAhead::next() {
  while (given == taken.events.size()) {
    if (taken.failure) std::rethrow_exception(taken.failure);
    if (taken.after != EntryReader::Result::entry) return taken.after;
    takeOver();
  }
  ++given;
  return EntryReader::Result::entry;
}

void ReadAhead::run(const Open& open, const Wanted& wanted) {
  try {
    filling.after = readLog(*open(), wanted);
  } catch (...) {
    filling.failure = std::current_exception();
  }
  handOver();
}

EntryReader::Result ReadAhead::readLog(EntryReader& reader, const Wanted& wanted) {
  reader.callBeforeWaiting([this] {
    if (!filling.events.empty()) handOver();
  });
  EntryReader::Result result = reader.next();
  for (; result == EntryReader::Result::entry; result = reader.next()) {
    if (wanted(reader.entry())) add(LogEvent(reader.entry()));
  }
  return result;
}

void ReadAhead::add(LogEvent event) {
  filling.bytes += event.size();
  filling.events.push_back(std::move(event));
  if (filling.bytes >= kBatchBytes) handOver();
}

void ReadAhead::handOver() {
  {
    std::unique_lock lock(mutex);
    changed.wait(lock, [this] { return !isReady || abandoned; });
    std::swap(filling, ready);
    isReady = true;
  }
  changed.notify_one();
  filling.events.clear();
  filling.bytes = 0;
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
