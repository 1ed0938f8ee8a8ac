#include "platform/host/log/JournalReader.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <span>
#include <stdexcept>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include "platform/host/log/JournalFaults.h"
#include "platform/host/log/Libsystemd.h"
#include "platform/host/log/LogEvent.h"

namespace host {
namespace {

const Libsystemd& lib() { return Libsystemd::shared(); }

constexpr std::string_view kCannotRead = "Cannot read the journal: ";

/// Thrown for an error of the library. The text says what it means.
class LibraryError : public std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// What an error of the library means, which has meanings of its own for some numbers.
std::string textOf(int number) {
  switch (number) {
    case ENODATA:
      return "cut off";
    case EBADMSG:
      return "no journal file, or damaged";
    case EIDRM:
      return "deleted while it was read";
    case EPROTONOSUPPORT:
      return "made by a later version of systemd";
    default:
      return std::generic_category().message(number);
  }
}

/// A journal that the library has open. Threads: all of it belongs to one thread.
class OpenJournal {
 public:
  /// Throws `LibraryError`.
  explicit OpenJournal(std::span<const JournalFile> files) {
    std::vector<posix::Descriptor> copies;
    copies.reserve(files.size());
    std::vector<int> numbers;
    for (const JournalFile& file : files) {
      copies.emplace_back(::fcntl(file.descriptor.get(), F_DUPFD_CLOEXEC, 0));
      if (!copies.back()) throw LibraryError(textOf(errno));
      numbers.push_back(copies.back().get());
    }
    sd_journal* opened = nullptr;
    const auto count = static_cast<unsigned>(numbers.size());
    const int result = lib().sd_journal_open_files_fd(&opened, numbers.data(), count, 0);
    if (result >= 0) {
      journal.reset(opened);
      for (posix::Descriptor& copy : copies) copy.release();  // they are the library's now
    }
    check(result);
  }

  sd_journal* get() const { return journal.get(); }

  /// `result`, of a call of the library, unless it is an error, which it throws.
  int check(int result) const {
    if (faults.any()) throw LibraryError("truncated while it was read");
    if (result < 0) throw LibraryError(textOf(-result));
    return result;
  }

 private:
  struct Close {
    void operator()(sd_journal* opened) const { lib().sd_journal_close(opened); }
  };

  JournalFaults faults;
  std::unique_ptr<sd_journal, Close> journal;
};

/// Throws `std::runtime_error`, whose text has `name`, when the library cannot open `files`.
void checkOpens(std::span<const JournalFile> files, const std::string& name) try {
  const OpenJournal journal(files);
} catch (const LibraryError& error) {
  throw std::runtime_error(std::string(kCannotRead) + name + error.what());
}

void checkAlone(const JournalFile& file) { checkOpens({&file, 1}, file.path.string() + ": "); }

/// The name and the value of a field, which the library gives as "NAME=value".
std::pair<std::string_view, std::string_view> nameAndValue(const void* data, std::size_t size) {
  const std::string_view whole(static_cast<const char*>(data), size);
  const std::size_t nameSize = std::min(whole.find('='), size);
  return {whole.substr(0, nameSize), whole.substr(std::min(nameSize + 1, size))};
}

constexpr std::uint64_t kBlockSize = 512;  // of st_blocks, see stat(3type)

/// What is uncompressed of a value: enough to see that it is too long.
constexpr std::size_t kMostOfAValue = kMaxField + 1024;

class JournalReader final : public EntryReader {
 public:
  JournalReader(const std::vector<JournalFile>& opened, OSLogDate date, const EventFilter& events,
                const StopSignal& signal)
      : files(opened), from(date), filter(events), stop(signal), journal(files) {}

  bool next() override try {
    if (!begun) begin();
    while (!stop.raised()) {
      constexpr unsigned kEntriesAtATime = 256;
      if (entries++ % kEntriesAtATime == 0) beforeWaiting();
      if (!mayHaveMore || journal.check(lib().sd_journal_next(journal.get())) == 0) {
        checkFiles();
        return false;
      }
      if (readEntry()) return true;
    }
    return false;
  } catch (const LibraryError& error) {
    checkFiles();  // may know which file it is
    throw std::runtime_error(std::string(kCannotRead) + error.what());
  }

 private:
  void begin() {
    begun = true;
    journal.check(lib().sd_journal_set_data_threshold(journal.get(), kMostOfAValue));
    mayHaveMore = addMatches();
    const auto since = std::max(from, OSLogDate(0)).microsecondsSince1970();
    journal.check(
        lib().sd_journal_seek_realtime_usec(journal.get(), static_cast<std::uint64_t>(since)));
  }

  /// Each file still has what its header says, and the library still has each file: it drops one
  /// that it cannot read or map any more, and goes on with the others.
  void checkFiles() const {
    std::uint64_t present = 0;
    for (const JournalFile& file : files) {
      checkAlone(file);
      struct stat about = {};
      ::fstat(file.descriptor.get(), &about);
      present += static_cast<std::uint64_t>(about.st_blocks) * kBlockSize;
    }
    std::uint64_t used = 0;
    if (lib().sd_journal_get_usage(journal.get(), &used) < 0 || used < present) {
      throw std::runtime_error(std::string(kCannotRead) +
                               "a file was overwritten while it was read, or there was too little "
                               "memory for it");
    }
  }

  /// False when the entry has no date that an event can have.
  bool readEntry() {
    current.clear();
    std::uint64_t date = 0;
    journal.check(lib().sd_journal_get_realtime_usec(journal.get(), &date));
    if (date > kMaxDate) return false;
    current.microseconds = static_cast<std::int64_t>(date);
    const void* data = nullptr;
    std::size_t length = 0;
    while (journal.check(lib().sd_journal_enumerate_data(journal.get(), &data, &length)) > 0) {
      const auto [name, value] = nameAndValue(data, length);
      const Field field = fieldCalled(name);
      if (field != Field::none && !current.has(field)) keep(field, value);
    }
    return true;
  }

  std::string place() const override {
    return "entry of " + std::to_string(current.microseconds) + " us";
  }

  // What the index is asked for: the values of the fields that a process name or an image's path
  // comes from, of which each that lets an event pass is a match. The filter itself decides, so
  // that matches may let pass too much, and nothing is missed.

  /// Adds the matches, unless they would cost more than they save; false when no event can pass.
  bool addMatches() {
    // For each entry that a match lets pass, the library looks into the index of all the others,
    // which takes a fifth of the time of reading an entry that is not wanted.
    constexpr std::size_t kMostMatches = 16;
    if (filter.passes(LogEntry())) return true;  // needs no field to pass
    const std::vector<std::string> matches = findMatches();
    if (matches.size() > kMostMatches) return true;
    for (const std::string& match : matches) {
      journal.check(lib().sd_journal_add_match(journal.get(), match.data(), match.size()));
      journal.check(lib().sd_journal_add_disjunction(journal.get()));
    }
    return !matches.empty();
  }

  std::vector<std::string> findMatches() {
    std::vector<std::string> matches;
    const std::vector<std::string> images = uniqueValues(Field::exe);
    for (const Field field :
         {Field::comm, Field::syslogIdentifier, Field::exe, Field::senderPath}) {
      for (const std::string& value : uniqueValues(field)) {
        LogEntry entry;
        entry.append(field, value);
        const bool passes =
            filter.passes(entry) || (field == Field::comm && passesWhole(entry, images));
        if (passes) matches.push_back(std::string(nameOf(field)) + '=' + value);
      }
    }
    return matches;
  }

  /// Whether one of `images` makes a longer name of the process of `entry`, one that passes.
  bool passesWhole(const LogEntry& entry, const std::vector<std::string>& images) const {
    return std::ranges::any_of(images, [&](const std::string& image) {
      LogEntry whole = entry;
      whole.append(Field::exe, image);
      return processOf(whole) != processOf(entry) && filter.passes(whole);
    });
  }

  /// The values that a field has anywhere in the journal; fewer once the reader is stopped.
  std::vector<std::string> uniqueValues(Field field) {
    std::vector<std::string> values;
    const std::string name(nameOf(field));
    journal.check(lib().sd_journal_query_unique(journal.get(), name.c_str()));
    const void* data = nullptr;
    std::size_t length = 0;
    while (!stop.raised() &&
           journal.check(lib().sd_journal_enumerate_unique(journal.get(), &data, &length)) > 0) {
      values.emplace_back(nameAndValue(data, length).second);
    }
    return values;
  }

  const std::vector<JournalFile>& files;
  const OSLogDate from;
  const EventFilter& filter;
  const StopSignal& stop;
  const OpenJournal journal;
  bool begun = false;
  bool mayHaveMore = true;
  unsigned entries = 0;
};

}  // namespace

void checkJournalFiles(const std::vector<JournalFile>& files) {
  for (const JournalFile& file : files) checkAlone(file);
  checkOpens(files, "");
}

std::unique_ptr<EntryReader> readJournal(const std::vector<JournalFile>& files, OSLogDate from,
                                         const EventFilter& filter, const StopSignal& stop) {
  return std::make_unique<JournalReader>(files, from, filter, stop);
}

}  // namespace host
