#include "platform/host/ReadAhead.h"

#include <algorithm>
#include <utility>

namespace host {
namespace {

constexpr std::size_t kBatchBytes = EntryReader::kBuffer;

std::size_t sizeOf(const LogEntry& entry) {
  std::size_t size = 0;
  for (const std::string_view value : entry.all()) size += value.size();
  return size;
}

}  // namespace

/// Hands over what has been read before it asks for more.
class ReadAhead::Source final : public ByteSource {
 public:
  Source(ReadAhead& owner, ByteSource& bytes) : reader(owner), source(bytes) {}

  std::int64_t read(char* buffer, std::size_t size) override {
    if (!reader.filling.entries.empty()) reader.handOver();
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
  while (given == taken.entries.size()) {
    if (taken.after != EntryReader::Result::entry) return taken.after;
    takeOver();
  }
  current = taken.entries[given++];
  return EntryReader::Result::entry;
}

void ReadAhead::readLog(ByteSource& source, const Wanted& wanted) {
  Source handingOver(*this, source);
  EntryReader reader(handingOver);
  EntryReader::Result result = reader.next();
  for (; result == EntryReader::Result::entry; result = reader.next()) {
    if (wanted(reader.entry())) add(reader.entry());
  }
  filling.after = result;
  handOver();
}

void ReadAhead::add(const LogEntry& entry) {
  const std::size_t size = sizeOf(entry);
  if (filling.bytes.capacity() - filling.bytes.size() < size) {
    if (!filling.entries.empty()) handOver();
    filling.bytes.reserve(std::max(size, kBatchBytes));
  }
  for (std::string_view& value : filling.entries.emplace_back(entry).all()) {
    if (value.data() == nullptr) continue;
    const std::size_t start = filling.bytes.size();
    filling.bytes.insert(filling.bytes.end(), value.begin(), value.end());
    value = {filling.bytes.data() + start, value.size()};
  }
}

void ReadAhead::handOver() {
  {
    std::unique_lock lock(mutex);
    changed.wait(lock, [this] { return !isReady || abandoned; });
    std::swap(filling, ready);
    isReady = true;
  }
  changed.notify_one();
  filling.entries.clear();
  filling.bytes.clear();
  // What a huge entry has left behind is not held for good.
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
