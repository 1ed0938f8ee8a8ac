#include "platform/host/log/EntryReader.h"

#include <algorithm>
#include <charconv>
#include <cstring>

namespace host {
namespace {

constexpr std::array<std::string_view, static_cast<std::size_t>(Field::none)> kNames = {
    "__REALTIME_TIMESTAMP",
    "LOG_GMTOFF",
    "LOG_TYPE",
    "TID",
    "_PID",
    "SYSLOG_PID",
    "LOG_ACTIVITY",
    "_COMM",
    "_EXE",
    "SYSLOG_IDENTIFIER",
    "LOG_SENDER_PATH",
    "LOG_SUBSYSTEM",
    "_SYSTEMD_UNIT",
    "_TRANSPORT",
    "LOG_CATEGORY",
    "MESSAGE",
};

Field fieldCalled(std::string_view name) {
  const auto* const found = std::ranges::find(kNames, name);
  return static_cast<Field>(found - kNames.begin());
}

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

EntryReader::EntryReader(ByteSource& bytes)
    : source(bytes), buffer(kBuffer + 1, '\n'), position(buffer.data()), limit(position) {}

const char* EntryReader::endOfLine() const {
  return static_cast<const char*>(std::memchr(position, '\n', rest() + 1));
}

EntryReader::Result EntryReader::next() {
  do {
    startEntry();
    if (outcome != Result::entry || !readEntry()) return outcome;
  } while (!readDate());
  return Result::entry;
}

void EntryReader::startEntry() {
  current = LogEntry();
  begun = complete = false;
  // What a huge field has left behind is not held for good.
  if (kept > kBuffer) copies = {};
  kept = 0;
}

bool EntryReader::readDate() {
  constexpr std::int64_t kEndOf9999 = 253'402'300'799'999'999;
  const std::string_view text = current[Field::realtimeTimestamp];
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, current.microseconds);
  return error == std::errc() && stop == end && current.microseconds >= 0 &&
         current.microseconds <= kEndOf9999;
}

bool EntryReader::readEntry() {
  while (!complete) {
    if (!readField()) return false;
  }
  return true;
}

bool EntryReader::readField() {
  // The end of the line first: the next field can be looked at before this one is understood.
  const char* const lineEnd = endOfLine();
  const char* const nameEnd = endOfName(position);
  const auto size = static_cast<std::size_t>(nameEnd - position);
  if (size > kMaxName) return damagedBy("a field name is too long");
  if (nameEnd == limit) return refill();  // and come back
  if (*nameEnd == '=' && size > 0) {
    const Field field = wanted({position, size});
    position = nameEnd + 1;
    return readText(field, lineEnd);
  }
  if (*nameEnd == '\n' && size > 0) {
    const Field field = wanted({position, size});
    position = nameEnd + 1;
    return readBinary(field);
  }
  if (*nameEnd == '\n') {
    complete = begun;
    ++position;
    return true;
  }
  return skipSeparator(lineEnd);
}

Field EntryReader::wanted(std::string_view name) {
  begun = true;
  const Field field = fieldCalled(name);
  return field != Field::none && !current.has(field) ? field : Field::none;
}

bool EntryReader::skipSeparator(const char* lineEnd) {
  if (begun || *position != kSeparatorPrefix[0]) return damagedBy("not a field name");
  if (lineEnd == limit) return rest() < kBuffer ? refill() : damagedBy("a line is too long");
  const std::string_view line(position, static_cast<std::size_t>(lineEnd - position));
  if (!line.starts_with(kSeparatorPrefix)) return damagedBy("not a field name");
  position = lineEnd + 1;
  return true;
}

bool EntryReader::readText(Field field, const char* lineEnd) {
  if (lineEnd != limit) {
    take(field, static_cast<std::size_t>(lineEnd - position));
  } else {
    startPieces(field);
    for (; lineEnd == limit; lineEnd = endOfLine()) {
      if (!takePiece(field, rest()) || !refill()) return false;
    }
    if (!takePiece(field, static_cast<std::size_t>(lineEnd - position))) return false;
    endPieces(field);
  }
  ++position;
  return true;
}

bool EntryReader::readBinary(Field field) {
  std::uint64_t length = 0;
  if (!readLength(length)) return false;
  if (length > kMaxField) return damagedBy("a field is too long");
  if (length < rest()) {
    take(field, length);
  } else {
    startPieces(field);
    while (length >= rest()) {
      length -= rest();
      if (!takePiece(field, rest()) || !refill()) return false;
    }
    if (!takePiece(field, length)) return false;
    endPieces(field);
  }
  if (*position != '\n') return damagedBy("no newline behind a binary field");
  ++position;
  return true;
}

bool EntryReader::readLength(std::uint64_t& length) {
  while (rest() < sizeof length) {
    if (!refill()) return false;
  }
  for (std::size_t i = 0; i < sizeof length; ++i) {
    length |= std::uint64_t{static_cast<unsigned char>(*position++)} << (8 * i);
  }
  return true;
}

void EntryReader::take(Field field, std::size_t size) {
  if (field != Field::none) current.at(field) = {position, size};
  position += size;
}

void EntryReader::startPieces(Field field) {
  pieces = 0;
  if (field != Field::none) copy(field).clear();
}

bool EntryReader::takePiece(Field field, std::size_t size) {
  pieces += size;
  if (field != Field::none) {
    kept += size;
    copy(field).append(position, size);
  }
  position += size;
  if (pieces > kMaxField) return damagedBy("a field is too long");
  return kept <= kMaxCopies || damagedBy("an entry is too long");
}

void EntryReader::endPieces(Field field) {
  if (field != Field::none) current.at(field) = copy(field);
}

bool EntryReader::refill() {
  leaveBuffer();
  const std::size_t left = rest();
  consumed += static_cast<std::uint64_t>(position - buffer.data());
  std::memmove(buffer.data(), position, left);
  position = buffer.data();
  const std::int64_t count = source.read(buffer.data() + left, kBuffer - left);
  char* const end = buffer.data() + left + (count > 0 ? count : 0);
  *end = '\n';
  limit = end;
  if (count > 0) return true;
  if (count != ByteSource::kEnd) {
    return stopWith(count == ByteSource::kStopped ? Result::stopped : Result::failed);
  }
  return begun || left > 0 ? damagedBy("cut off in an entry") : stopWith(Result::end);
}

void EntryReader::leaveBuffer() {
  for (std::size_t i = 0; i < copies.size(); ++i) {
    std::string_view& value = current.at(static_cast<Field>(i));
    if (value.data() == nullptr || value.data() == copies[i].data()) continue;
    kept += value.size();
    value = copies[i].assign(value);
  }
}

bool EntryReader::stopWith(Result result) {
  outcome = result;
  return false;
}

bool EntryReader::damagedBy(const char* what) {
  found = {what, consumed + static_cast<std::uint64_t>(position - buffer.data())};
  return stopWith(Result::damaged);
}

}  // namespace host
