#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/host/log/EntryReader.h"

namespace host {

/// Reads a log in the Journal Export Format, one entry after the other, from any bytes at all.
///
/// An entry ends with an empty line. A log that stops anywhere else, even after the line of a
/// field, is cut off: its last entry is dropped, and its end is damage. A log of no bytes is
/// complete.
///
/// Damage is also: a field name that is empty, longer than kMaxName, or not of A-Z, 0-9 and _;
/// wanted fields longer than an entry may have; a binary field without a newline after it.
///
/// Skipped silently: an entry without a valid date and, between entries, empty lines and lines that
/// start with "-- ", which journalctl writes at a reboot.
///
/// Memory is one buffer, and the wanted fields of one entry.
class RecordedLogReader final : public EntryReader {
 public:
  static constexpr std::size_t kBuffer = std::size_t{256} << 10;
  static constexpr std::size_t kMaxName = 255;

  /// Puts the next bytes of the log, at most `size` (which is not 0), into `buffer`, and returns
  /// their number: 0 at the end, nothing when the reader has been asked to stop. May block. Throws
  /// `std::system_error` when the rest cannot be read. Called again only after a number above 0.
  using ReadBytes = std::function<std::optional<std::size_t>(char* buffer, std::size_t size)>;

  explicit RecordedLogReader(ReadBytes bytes);

  bool next() override;

 private:
  bool readDate();

  // Each of these is false when nothing more is to be read. `field` is none where the value is not
  // wanted; `lineEnd` is `limit` where the line continues after it.
  bool readField();
  bool skipSeparator(const char* lineEnd);
  bool readText(Field field, const char* lineEnd);
  bool readBinary(Field field);
  bool readLength(std::uint64_t& length);
  bool refill();

  void take(Field field, std::size_t size);
  std::string place() const override;
  const char* endOfLine() const;
  Field wanted(std::string_view name) const;
  std::size_t rest() const { return static_cast<std::size_t>(limit - position); }

  const ReadBytes readBytes;
  std::vector<char> buffer;    ///< of kBuffer bytes, and a newline after those that it holds
  const char* position;        ///< of the first byte not yet read, in the buffer
  const char* limit;           ///< the end of what the buffer holds
  std::uint64_t consumed = 0;  ///< bytes of the log before the buffer

  bool begun = false;     ///< a field of the current entry has been read, or begun
  bool complete = false;  ///< the current entry is whole
};

}  // namespace host
