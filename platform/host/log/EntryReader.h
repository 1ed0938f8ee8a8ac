#pragma once

#include <functional>
#include <stdexcept>
#include <utility>

#include "platform/host/log/LogEntry.h"

namespace host {

/// Thrown for a log that is damaged or cut off, or has more in an entry than may be. The text says
/// what is wrong, and where.
class DamagedLog : public std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// Reads a log, one entry after the other: a recorded log or a journal.
///
/// Threads: all of it, making and destroying included, belongs to one thread.
class EntryReader {
 public:
  EntryReader() = default;
  EntryReader(const EntryReader&) = delete;
  EntryReader& operator=(const EntryReader&) = delete;
  virtual ~EntryReader() = default;

  /// Reads on to the next entry. False at the end of the log, and when the reader has been asked to
  /// stop. May block. Throws `DamagedLog`; another exception, with the reason as its text, when the
  /// rest of the log cannot be read. Called again only after an entry.
  virtual bool next() = 0;

  /// The entry of the last `next`, always the same object. Its values are valid until the next
  /// call.
  const LogEntry& entry() const { return current; }

  /// Sets what `next` calls each time before it may block, and now and then between entries.
  void callBeforeWaiting(std::function<void()> call) { beforeWaiting = std::move(call); }

 protected:
  /// Appends `piece` to a value of the current entry. Throws `DamagedLog` for too many bytes.
  void keep(Field field, std::string_view piece) {
    current.append(field, piece);
    if (current[field].size() > kMaxField) damagedBy("a field is too long");
    if (current.size() > kMaxFields) damagedBy("an entry is too long");
  }

  [[noreturn]] void damagedBy(const char* what) const { throw DamagedLog(place() + ": " + what); }

  LogEntry current;
  std::function<void()> beforeWaiting = [] {};

 private:
  /// Where in the log the reader is, for the texts of `DamagedLog`.
  virtual std::string place() const = 0;
};

}  // namespace host
