#include "platform/host/log/ReadAhead.h"

#include <algorithm>
#include <utility>

namespace host {
namespace {

constexpr std::size_t kBatchBytes = std::size_t{256} << 10;

}  // namespace

FinishedEvent::FinishedEvent(const LogEvent& event)
    : thread(event.threadIdentifier()),
      activity(event.activityIdentifier()),
      moment(event.date()),
      zone(event.timeZone()),
      kind(event.type()),
      pid(event.processIdentifier()),
      texts{event.process(), event.sender(), event.subsystem(), event.category(),
            event.composedMessage()} {}

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
  const LogEvent event(reader.entry());
  EntryReader::Result result = reader.next();
  for (; result == EntryReader::Result::entry; result = reader.next()) {
    if (wanted(event)) add(event);
  }
  return result;
}

void ReadAhead::add(const LogEvent& event) {
  FinishedEvent finished(event);
  std::size_t size = 0;
  for (const std::string_view text : finished.allTexts()) size += text.size();
  if (filling.bytes.capacity() - filling.bytes.size() < size) {
    if (!filling.events.empty()) handOver();
    filling.bytes.reserve(std::max(size, kBatchBytes));
  }
  for (std::string_view& text : finished.allTexts()) {
    const std::size_t start = filling.bytes.size();
    filling.bytes.insert(filling.bytes.end(), text.begin(), text.end());
    text = {filling.bytes.data() + start, text.size()};
  }
  filling.events.push_back(finished);
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
  filling.bytes.clear();
  // The buffer of a huge event is not kept.
  if (filling.bytes.capacity() > kBatchBytes) filling.bytes = std::vector<char>();
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
