#include "platform/host/log/RecordedLogReader.h"

#include <array>
#include <charconv>
#include <cstring>
#include <utility>

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

constexpr std::string_view kSeparatorPrefix = "-- ";

}  // namespace

RecordedLogReader::RecordedLogReader(ReadBytes bytes)
    : readBytes(std::move(bytes)),
      buffer(kBuffer + 1, '\n'),
      position(buffer.data()),
      limit(position) {}

const char* RecordedLogReader::endOfLine() const {
  return static_cast<const char*>(std::memchr(position, '\n', rest() + 1));
}

bool RecordedLogReader::next() {
  do {
    current.clear();
    begun = complete = false;
    while (!complete) {
      if (!readField()) return false;
    }
  } while (!readDate());
  return true;
}

bool RecordedLogReader::readDate() {
  const std::string_view text = current[Field::realtimeTimestamp];
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, current.microseconds);
  return error == std::errc() && stop == end && current.microseconds >= 0 &&
         current.microseconds <= kMaxDate;
}

bool RecordedLogReader::readField() {
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

Field RecordedLogReader::wanted(std::string_view name) const {
  const Field field = fieldCalled(name);
  return field != Field::none && !current.has(field) ? field : Field::none;
}

bool RecordedLogReader::skipSeparator(const char* lineEnd) {
  if (begun || *position != kSeparatorPrefix[0]) damagedBy("not a field name");
  if (lineEnd == limit) {
    if (rest() == kBuffer) damagedBy("a line is too long");
    return refill();
  }
  const std::string_view line(position, static_cast<std::size_t>(lineEnd - position));
  if (!line.starts_with(kSeparatorPrefix)) damagedBy("not a field name");
  position = lineEnd + 1;
  return true;
}

bool RecordedLogReader::readText(Field field, const char* lineEnd) {
  for (; lineEnd == limit; lineEnd = endOfLine()) {
    take(field, rest());
    if (!refill()) return false;
  }
  take(field, static_cast<std::size_t>(lineEnd - position));
  ++position;
  return true;
}

bool RecordedLogReader::readBinary(Field field) {
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

bool RecordedLogReader::readLength(std::uint64_t& length) {
  while (rest() < sizeof length) {
    if (!refill()) return false;
  }
  for (std::size_t i = 0; i < sizeof length; ++i) {
    length |= std::uint64_t{static_cast<unsigned char>(*position++)} << (8 * i);
  }
  return true;
}

void RecordedLogReader::take(Field field, std::size_t size) {
  if (field != Field::none) keep(field, {position, size});
  position += size;
}

bool RecordedLogReader::refill() {
  const std::size_t left = rest();
  consumed += static_cast<std::uint64_t>(position - buffer.data());
  std::memmove(buffer.data(), position, left);
  position = buffer.data();
  beforeWaiting();
  const std::optional<std::size_t> count = readBytes(buffer.data() + left, kBuffer - left);
  char* const end = buffer.data() + left + count.value_or(0);
  *end = '\n';
  limit = end;
  if (count.value_or(0) > 0) return true;
  if (count && (begun || left > 0)) damagedBy("cut off in an entry");
  return false;
}

std::string RecordedLogReader::place() const {
  const std::uint64_t offset = consumed + static_cast<std::uint64_t>(position - buffer.data());
  return "damaged at byte " + std::to_string(offset);
}

}  // namespace host
