#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "platform/host/log/ByteSource.h"

namespace host {

/// The fields of an entry that an event is made of. All others are skipped.
enum class Field : std::uint8_t {
  realtimeTimestamp,
  gmtOffset,
  type,
  tid,
  pid,
  syslogPid,
  activity,
  comm,
  exe,
  syslogIdentifier,
  senderPath,
  subsystem,
  systemdUnit,
  transport,
  category,
  message,
  none  ///< not a field: their number
};

/// One entry of a log: the first value of each field, as it stood there. The bytes may be any.
struct LogEntry {
  /// The date: microseconds since 1970, at most those of the end of the year 9999.
  std::int64_t microseconds = 0;

  bool has(Field field) const { return at(field).data() != nullptr; }
  std::string_view operator[](Field field) const { return at(field); }

  const std::string_view& at(Field field) const { return values[static_cast<std::size_t>(field)]; }
  std::string_view& at(Field field) { return values[static_cast<std::size_t>(field)]; }

  /// One value for each field; a field that the entry does not have is one without data.
  using Values = std::array<std::string_view, static_cast<std::size_t>(Field::none)>;

 private:
  Values values;
};

/// Reads a log in the Journal Export Format, one entry after the other, from any bytes at all.
///
/// An entry is whole when the empty line behind it has been read, and only whole entries are
/// given. So a log that stops anywhere else is cut, be it behind the line of a field: its last
/// entry is dropped and its end is damage. A log of no bytes is whole.
///
/// Damage is, besides: a field name that is empty, longer than kMaxName, or not of A-Z, 0-9 and _;
/// a field longer than kMaxField; fields of one entry that need copies longer than kMaxCopies; a
/// binary field without a newline behind it. Nothing that follows damage is read.
///
/// Skipped without a word: an entry that has no date or one that cannot be read, and, between
/// entries, empty lines and lines that start with "-- ", which journalctl puts there for a reboot.
///
/// Memory is one buffer, and copies of those kept fields that do not fit into it.
/// Threads: one at a time. The source must outlive the reader.
class EntryReader {
 public:
  static constexpr std::size_t kBuffer = std::size_t{256} << 10;
  static constexpr std::size_t kMaxName = 255;
  static constexpr std::size_t kMaxField = std::size_t{32} << 20;
  static constexpr std::size_t kMaxCopies = std::size_t{64} << 20;

  enum class Result { entry, end, damaged, failed, stopped };

  struct Damage {
    const char* what = "";
    std::uint64_t offset = 0;  ///< in bytes from the start of the log, where it was noticed
  };

  explicit EntryReader(ByteSource& bytes);

  /// Reads on to the next entry. `entry` is the only result that another may follow; after any
  /// other, every further call gives the same. `failed` and `stopped` are the source's.
  Result next();

  /// The entry of the last `next`, always the same object. Its values are valid until the next
  /// call.
  const LogEntry& entry() const { return current; }

  const Damage& damage() const { return found; }

 private:
  void startEntry();
  bool readEntry();
  bool readDate();

  // Each of these is false when the log ends there, with `outcome` set. `field` is none where the
  // value is not wanted; `lineEnd` is `limit` where the line goes on behind it.
  bool readField();
  bool skipSeparator(const char* lineEnd);
  bool readText(Field field, const char* lineEnd);
  bool readBinary(Field field);
  bool readLength(std::uint64_t& length);
  bool refill();
  bool stopWith(Result result);
  bool damagedBy(const char* what);

  // A value is taken where it lies, or piece by piece into a copy when the buffer cannot hold it.
  void take(Field field, std::size_t size);
  void startPieces(Field field);
  bool takePiece(Field field, std::size_t size);
  void endPieces(Field field);
  void leaveBuffer();

  const char* endOfLine() const;
  Field wanted(std::string_view name);
  std::size_t rest() const { return static_cast<std::size_t>(limit - position); }
  std::string& copy(Field field) { return copies[static_cast<std::size_t>(field)]; }

  ByteSource& source;
  std::vector<char> buffer;    ///< of kBuffer bytes, and a newline after those that it holds
  const char* position;        ///< of the first byte not yet read, in the buffer
  const char* limit;           ///< the end of what the buffer holds
  std::uint64_t consumed = 0;  ///< bytes of the log before the buffer

  LogEntry current;
  bool begun = false;      ///< a field of the current entry has been read, or begun
  bool complete = false;   ///< the current entry is whole
  std::size_t pieces = 0;  ///< bytes taken of the current field
  std::size_t kept = 0;    ///< bytes of the current entry in `copies`
  std::array<std::string, static_cast<std::size_t>(Field::none)> copies;

  Result outcome = Result::entry;
  Damage found;
};

}  // namespace host
