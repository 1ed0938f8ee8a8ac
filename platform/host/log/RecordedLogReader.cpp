#include "platform/host/log/RecordedLogReader.h"

#include <array>
#include <charconv>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <utility>
#include <vector>

namespace host {
namespace {

constexpr std::array<bool, 256> kNameBytes = [] {
  std::array<bool, 256> table{};
  for (unsigned char byte = '0'; byte <= '9'; ++byte) table[byte] = true;
  for (unsigned char byte = 'A'; byte <= 'Z'; ++byte) table[byte] = true;
  table['_'] = true;
  return table;
}();

/// The first byte from `start` on that is not one of a name. At the end of the buffer there is one.
const char* endOfName(const char* start) {
  while (kNameBytes[static_cast<unsigned char>(*start)]) ++start;
  return start;
}

constexpr std::size_t kMaxName = 255;
constexpr std::string_view kSeparatorPrefix = "-- ";

class RecordedLogReader final : public EntryReader {
 public:
  explicit RecordedLogReader(ReadBytes bytes)
      : readBytes(std::move(bytes)),
        buffer(kRecordedLogBuffer + 1, '\n'),
        position(buffer.data()),
        limit(position) {}

  bool next() override {
    do {
      current.clear();
      begun = complete = false;
      while (!complete) {
        if (!readField()) return false;
      }
    } while (!readDate());
    return true;
  }

 private:
  bool readDate() {
    const std::string_view text = current[Field::realtimeTimestamp];
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, current.microseconds);
    return error == std::errc() && stop == end && current.microseconds >= 0 &&
           current.microseconds <= kMaxDate;
  }

  // What reads is false when nothing more is to be read. `field` is none where the value is not
  // wanted; `lineEnd` is `limit` where the line continues after it.

  bool readField() {
    // The end of the line first: the next field can be looked at before this one is understood.
    const char* const lineEnd = endOfLine();
    const char* const nameEnd = endOfName(position);
    const auto size = static_cast<std::size_t>(nameEnd - position);
    if (size > kMaxName) damagedBy("a field name is too long");
    if (nameEnd == limit) return refill();  // and come back
    if (size > 0 && (*nameEnd == '=' || *nameEnd == '\n')) {
      const Field field = wanted({position, size});
      begun = true;
      position = nameEnd + 1;
      return *nameEnd == '=' ? readText(field, lineEnd) : readBinary(field);
    }
    if (*nameEnd == '\n') {
      complete = begun;
      ++position;
      return true;
    }
    return skipSeparator(lineEnd);
  }

  Field wanted(std::string_view name) const {
    const Field field = fieldCalled(name);
    return field != Field::none && !current.has(field) ? field : Field::none;
  }

  bool skipSeparator(const char* lineEnd) {
    if (begun || *position != kSeparatorPrefix[0]) damagedBy("not a field name");
    if (lineEnd == limit) {
      if (rest() == kRecordedLogBuffer) damagedBy("a line is too long");
      return refill();
    }
    const std::string_view line(position, static_cast<std::size_t>(lineEnd - position));
    if (!line.starts_with(kSeparatorPrefix)) damagedBy("not a field name");
    position = lineEnd + 1;
    return true;
  }

  bool readText(Field field, const char* lineEnd) {
    for (; lineEnd == limit; lineEnd = endOfLine()) {
      take(field, rest());
      if (!refill()) return false;
    }
    take(field, static_cast<std::size_t>(lineEnd - position));
    ++position;
    return true;
  }

  bool readBinary(Field field) {
    std::uint64_t length = 0;
    if (!readLength(length)) return false;
    while (length >= rest()) {
      length -= rest();
      take(field, rest());
      if (!refill()) return false;
    }
    take(field, static_cast<std::size_t>(length));
    if (*position != '\n') damagedBy("no newline after a binary field");
    ++position;
    return true;
  }

  bool readLength(std::uint64_t& length) {
    while (rest() < sizeof length) {
      if (!refill()) return false;
    }
    for (std::size_t i = 0; i < sizeof length; ++i) {
      length |= std::uint64_t{static_cast<unsigned char>(*position++)} << (8 * i);
    }
    return true;
  }

  void take(Field field, std::size_t size) {
    if (field != Field::none) keep(field, {position, size});
    position += size;
  }

  bool refill() {
    const std::size_t left = rest();
    consumed += static_cast<std::uint64_t>(position - buffer.data());
    std::memmove(buffer.data(), position, left);
    position = buffer.data();
    beforeWaiting();
    const std::optional<std::size_t> count =
        readBytes(buffer.data() + left, kRecordedLogBuffer - left);
    char* const end = buffer.data() + left + count.value_or(0);
    *end = '\n';
    limit = end;
    if (count.value_or(0) > 0) return true;
    if (count && (begun || left > 0)) damagedBy("cut off in an entry");
    return false;
  }

  const char* endOfLine() const {
    return static_cast<const char*>(std::memchr(position, '\n', rest() + 1));
  }

  std::size_t rest() const { return static_cast<std::size_t>(limit - position); }

  std::string place() const override {
    const std::uint64_t offset = consumed + static_cast<std::uint64_t>(position - buffer.data());
    return "damaged at byte " + std::to_string(offset);
  }

  const ReadBytes readBytes;
  std::vector<char> buffer;    ///< and a newline after those that it holds
  const char* position;        ///< of the first byte not yet read, in the buffer
  const char* limit;           ///< the end of what the buffer holds
  std::uint64_t consumed = 0;  ///< bytes of the log before the buffer

  bool begun = false;     ///< a field of the current entry has been read, or begun
  bool complete = false;  ///< the current entry is whole
};

}  // namespace

std::unique_ptr<EntryReader> readRecordedLog(ReadBytes readBytes) {
  return std::make_unique<RecordedLogReader>(std::move(readBytes));
}

}  // namespace host
