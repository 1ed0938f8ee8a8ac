#include "platform/host/log/ReadAhead.h"

#include <algorithm>
#include <utility>

namespace host {
namespace {

constexpr std::size_t kBatchBytes = EntryReader::kBuffer;

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

/// Hands over what has been read before it asks for more.
class ReadAhead::Source final : public ByteSource {
 public:
  Source(ReadAhead& owner, ByteSource& bytes) : reader(owner), source(bytes) {}

  std::int64_t read(char* buffer, std::size_t size) override {
    if (!reader.filling.events.empty()) reader.handOver();
    return source.read(buffer, size);
  }

 private:
  ReadAhead& reader;
  ByteSource& source;
};

ReadAhead::ReadAhead(ByteSource& source, Wanted wanted)
    : thread([this, &source, wanted = std::move(wanted)] { readLog(source, wanted); }) {}

ReadAhead::~ReadAhead() {
  {
    const std::lock_guard lock(mutex);
    abandoned = true;
  }
  changed.notify_one();
  thread.join();
}

EntryReader::Result ReadAhead::next() {
  while (given == taken.events.size()) {
    if (taken.after != EntryReader::Result::entry) return taken.after;
    takeOver();
  }
  ++given;
  return EntryReader::Result::entry;
}

void ReadAhead::readLog(ByteSource& source, const Wanted& wanted) {
  Source handingOver(*this, source);
  EntryReader reader(handingOver);
  const LogEvent event(reader.entry());
  EntryReader::Result result = reader.next();
  for (; result == EntryReader::Result::entry; result = reader.next()) {
    if (wanted(event)) add(event);
  }
  filling.after = result;
  handOver();
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
  // What a huge event has left behind is not held for good.
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
