#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <limits>
#include <map>
#include <stdexcept>
#include <thread>

#include "platform/host/ProcessName.h"
#include "platform/host/device/Device.h"
#include "platform/host/log/EntryReader.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/FoldedText.h"
#include "platform/host/log/LogEvent.h"
#include "platform/host/log/LogSource.h"
#include "platform/host/log/StreamEnd.h"
#include "platform/oslog_store.h"
#include "platform/posix/Utf8.h"
#include "tests/Program.h"
#include "tests/Table.h"

using namespace std::chrono_literals;
using namespace std::string_literals;
using host::EntryReader;
using Texts = std::vector<std::string>;

namespace {

const std::string kDate = "__REALTIME_TIMESTAMP=1700000000000000\n";

const std::string kForged = "x\n\nMESSAGE=forged\n" + kDate + "\n";

/// An entry's binary field, whose declared length may be another than its own.
std::string binary(const std::string& name, const std::string& value, std::uint64_t length) {
  std::string text = name + '\n';
  for (int i = 0; i < 8; ++i) text += static_cast<char>(length >> (8 * i));
  return text + value + '\n';
}
std::string binary(const std::string& name, const std::string& value) {
  return binary(name, value, value.size());
}

struct Pieces final : host::ByteSource {
  Pieces(std::string_view bytes, std::size_t most) : rest(bytes), piece(most) {}
  std::int64_t read(char* buffer, std::size_t size) override {
    const std::size_t count = rest.copy(buffer, std::min(size, piece));
    rest.remove_prefix(count);
    return static_cast<std::int64_t>(count);
  }
  std::string_view rest;
  std::size_t piece;
};

/// The messages of a log, and behind them how it ends.
Texts readAll(std::string_view log, std::size_t piece = 1 << 20) {
  Pieces source(log, piece);
  EntryReader reader(source);
  Texts seen;
  while (reader.next() == EntryReader::Result::entry) {
    seen.emplace_back(reader.entry()[host::Field::message]);
  }
  const bool whole = reader.next() == EntryReader::Result::end;
  seen.emplace_back(whole ? "end" : reader.damage().what);
  return seen;
}

std::string summary(const OSLogEventProxy& event) {
  std::string text = std::to_string(event.type());
  for (const std::uint64_t number : {event.threadIdentifier(), event.activityIdentifier(),
                                     static_cast<std::uint64_t>(event.processIdentifier())}) {
    text += ' ' + std::to_string(number);
  }
  for (const auto part : {event.process(), event.sender(), event.subsystem(), event.category(),
                          event.composedMessage()}) {
    text.append("|").append(part);
  }
  return text + '@' + std::to_string(event.timeZone().secondsFromGMT(event.date()));
}

TEST(RecordedLog, EachPartOfAnEventHasItsFieldsInLine) {
  for (const auto& row : readTable("event-fields", 2)) {
    const std::string log = kDate + row[0] + '\n';
    Pieces source(log, 1);
    EntryReader reader(source);
    ASSERT_EQ(reader.next(), EntryReader::Result::entry);
    EXPECT_EQ(summary(host::LogEvent(reader.entry())), row[1]) << row[0];
  }
}

TEST(RecordedLog, DeliversWhatIsWholeAndTellsDamage) {
  const std::map<char, std::string> parts = {{'D', kDate},
                                             {'G', kDate + "MESSAGE=m\n\n"},
                                             {'N', std::string(255, 'A')},
                                             {'F', binary("MESSAGE", kForged)},
                                             {'O', binary("OTHER", kForged)},
                                             {'S', binary("MESSAGE", "xyz", 2)},
                                             {'C', binary("X", "", EntryReader::kMaxField + 1)},
                                             {'L', binary("X", "", ~0ULL)}};
  for (const auto& row : readTable("damage", 2)) {
    std::string log;
    for (std::size_t i = 0; i < row[0].size(); ++i) {
      log += row[0][i] == '%' ? parts.at(row[0][++i]) : row[0].substr(i, 1);
    }
    for (const std::size_t piece : {std::size_t{1}, log.size() + 1}) {
      std::string seen;
      for (const auto& text : readAll(log, piece))
        seen += (text == kForged ? "FORGED" : text) + "; ";
      EXPECT_EQ(seen, row[1] + "; ") << row[0];
    }
  }
}

TEST(RecordedLog, CutOffAnywhereLosesTheLastEntryAlone) {
  const std::string first = "-- Boot --\n" + kDate + "MESSAGE=one\n\n";
  const std::string second = kDate + binary("MESSAGE", "t\n\no") + "OTHER=1\n\n";
  const std::string log = first + second;
  for (std::size_t length = 0; length <= log.size(); ++length) {
    Texts seen;
    if (length >= first.size()) seen.emplace_back("one");
    if (length == log.size()) seen.emplace_back("t\n\no");
    const bool whole =
        length == 0 || length == first.size() || length == log.size() || length == first.find('_');
    seen.emplace_back(whole ? "end" : "cut off in an entry");
    EXPECT_EQ(readAll(log.substr(0, length)), seen) << length;
  }
}

TEST(RecordedLog, LongFieldsAreWholeUpToTheCap) {
  const auto logOf = [](const std::string& value) {
    const std::string name = "_COMM=c\nMESSAGE";
    return kDate + binary(name, value) + binary("X", value) + "\n" + kDate + name + "=" + value +
           "\nX=" + value + "\n\n";
  };
  std::vector<std::size_t> sizes = {10'000'000, EntryReader::kMaxField};
  for (std::size_t off = 0; off < 120; ++off) sizes.push_back(EntryReader::kBuffer - off);
  for (const std::size_t size : sizes) {
    const std::string value(size, 'v');
    ASSERT_TRUE(readAll(logOf(value)) == (Texts{value, value, "end"})) << size;
  }
  const std::string most(EntryReader::kMaxField, 'v');
  EXPECT_EQ(readAll(kDate + "X=" + most + "v\n\n"), Texts{"a field is too long"});
  EXPECT_EQ(readAll(kDate + "_EXE=" + most + "\n_COMM=" + most + "\nMESSAGE=" + most + "\n\n"),
            Texts{"an entry is too long"});
}

TEST(Text, Utf8IsRepairedByMaximalSubparts) {
  for (const auto& row : readTable("utf8", 2)) {
    std::string storage;
    EXPECT_EQ(posix::asUtf8(row[0], storage), row[1]);
    EXPECT_EQ(posix::isUtf8(row[0]), row[0] == row[1]) << row[1];
  }
}

TEST(Text, FoldingIgnoresCaseAndDiacritics) {
  for (const auto& row : readTable("folding", 3)) {
    EXPECT_EQ(host::FoldedText(row[0]).isIn(row[1]), row[2] == "true") << row[0];
  }
}

TEST(Text, DatesHaveTheirDefaultForm) {
  using Limits = std::numeric_limits<std::int64_t>;
  for (const auto& row : readTable("dates", 2)) {
    std::string text;
    OSLogDate(std::stoll(row[0])).appendDescription(text);
    EXPECT_EQ(text, row[1]);
  }
  const OSLogDate date(5);
  EXPECT_EQ(date.addingSeconds(-0.29), OSLogDate(5 - 290'000));
  EXPECT_EQ(date.addingSeconds(std::nan("")), date);
  EXPECT_EQ(date.addingSeconds(INFINITY), OSLogDate(Limits::max()));
  EXPECT_EQ(date.addingSeconds(0x1p63 / 1e6), OSLogDate(Limits::max()));
  EXPECT_EQ(OSLogDate(Limits::min()).addingSeconds(-1), OSLogDate(Limits::min()));
}

TEST(Text, TheLocalZoneHasItsSummerTime) {
  setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);
  tzset();
  std::thread([] {  // one that has not asked before
    const OSLogTimeZone local;
    EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'846'799'999'999)), 3'600);
    EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'846'800'000'000)), 7'200);
  })
      .join();
  unsetenv("TZ");
  tzset();
}

/// What a stream has delivered: the summaries, and the reason of its end.
struct Delivered {
  Texts events;
  unsigned long reason = 0;
};

class LogStore : public testing::Test {
 protected:
  ~LogStore() override {
    host::device() = device;
    setenv("PATH", path.c_str(), 1);
  }

  std::string write(const std::string& name, const std::string& text, mode_t mode = 0644) {
    std::string file = scratch.path(name);
    writeFile(file, text);
    chmod(file.c_str(), mode);
    return file;
  }

  /// Puts a journalctl on the PATH that answers the first question and then runs `script`.
  void installJournalctl(const std::string& script) {
    write("journalctl",
          "#!/bin/sh\ncd " + folder + "\ncase \"$*\" in *lines=0*) exit 0;; esac\n" + script + "\n",
          0755);
    setenv("PATH", (folder + ":/usr/bin:/bin").c_str(), 1);
  }

  static std::string prepareError(const std::string& log) {
    std::optional<std::string> error;
    host::device().log = log;
    OSLogEventStore::localStore()->prepareWithCompletionHandler([&](auto source, const auto& why) {
      EXPECT_EQ(source == nullptr, (error = why).has_value());
    });
    return error.value_or("none");
  }

  static std::shared_ptr<OSLogEventStream> stream(const std::string& log) {
    std::shared_ptr<OSLogEventStream> made;
    host::device().log = log;
    OSLogEventStore::localStore()->prepareWithCompletionHandler([&](auto source, const auto& why) {
      EXPECT_EQ(why.value_or("none"), "none");
      made = OSLogEventStream::initWithSource(source);
    });
    return made;
  }

  /// Runs a stream to its end; it is invalidated by its event number `stopAt`, if there is one.
  static Delivered run(const std::shared_ptr<OSLogEventStream>& from, std::size_t stopAt = 0,
                       OSLogDate date = OSLogDate(0)) {
    Delivered delivered;
    const auto ended = dispatch::group::create();
    from->setEventHandler([&, weak = std::weak_ptr(from)](const OSLogEventProxy& event) {
      delivered.events.push_back(summary(event));
      if (delivered.events.size() == stopAt) weak.lock()->invalidate();
    });
    from->setInvalidationHandler(
        [&delivered, member = dispatch::membership(ended)](unsigned long reason, const auto&) {
          EXPECT_EQ(std::exchange(delivered.reason, reason), 0);
        });
    from->activateStreamFromDate(date);
    from->setInvalidationHandler(nullptr);
    EXPECT_TRUE(ended.wait(60s));
    EXPECT_EQ(waitpid(-1, nullptr, WNOHANG), -1) << "a process has been left";
    return delivered;
  }

  const ScratchFolder scratch;
  const std::string folder = std::filesystem::path(scratch.path("file")).parent_path();
  const std::string path = getenv("PATH");
  const host::Profile device = host::device();
};

TEST_F(LogStore, DeliversWhatIsWantedInItsOrderAndEndsAsTheProfileSays) {
  const std::string log =
      write("log",
            "__REALTIME_TIMESTAMP=3000000\n_COMM=a\nMESSAGE=3\n\n__REALTIME_TIMESTAMP=1999999\n"
            "_COMM=a\n\n__REALTIME_TIMESTAMP=2000000\n_COMM=b\n_EXE=/A/É\nMESSAGE=2\n\n"
            "__REALTIME_TIMESTAMP=4000000\n_COMM=ab\n\n");
  auto wanted = stream(log);
  wanted->setFilterPredicate(
      {{{"process == %@", "a"}, {"senderImagePath CONTAINS[cd] %@", "a/e"}}});
  Delivered delivered = run(wanted, 0, OSLogDate(2'000'000));
  EXPECT_EQ(delivered.events, (Texts{"1024 0 0 0|a|a|||3@0", "1024 0 0 0|b|É|||2@0"}));
  EXPECT_EQ(delivered.reason, kOSLogEventStreamEndOfLog);
  EXPECT_THROW(stream(log)->setFilterPredicate({{{"pid == %@", "1"}}}), std::invalid_argument);

  host::device().logEnd = 9;
  EXPECT_EQ(run(stream(log)).reason, 9);
  EXPECT_EQ(run(stream(write("cut", kDate))).reason, host::kStreamDamaged);
  host::device().logEnd = std::nullopt;
  delivered = run(stream(log), 4);  // stays open behind the last event
  EXPECT_EQ(delivered.events.size(), 4);
  EXPECT_EQ(delivered.reason, host::kStreamInvalidated);
  EXPECT_EQ(run(stream(log), 2).events.size(), 2);
  const auto stopped = stream(log);
  stopped->invalidate();
  EXPECT_EQ(run(stopped).events.size(), 0);
}

TEST_F(LogStore, InvalidateInterruptsAReadThatIsBlocked) {
  const std::string pipe = folder + "/pipe";
  ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
  const auto blocked = stream(pipe);  // does not wait for a writer
  std::ofstream writer(pipe);
  writer << kDate << "\n" << std::flush;
  EXPECT_EQ(run(blocked, 1).reason, host::kStreamInvalidated);
}

TEST_F(LogStore, SaysWhyItCannotBePrepared) {
  host::device().logPrepareError = "Out of order";
  EXPECT_EQ(prepareError("sample"), "Out of order");
  host::device().logPrepareError.clear();
  EXPECT_EQ(prepareError(folder + "/none"), folder + "/none: No such file or directory");
  EXPECT_EQ(prepareError(folder), "No journal: no journal files in " + folder);

  const std::string file = write("system.journal", "", 0);
  const bool isRoot = geteuid() == 0;
  chmod(folder.c_str(), 0755);
  ASSERT_TRUE(!isRoot || seteuid(65534) == 0);
  EXPECT_EQ(prepareError(folder), "Cannot read the journal: " + file +
                                      ": Permission denied. Run as "
                                      "root or as a member of the group systemd-journal");
  ASSERT_TRUE(!isRoot || seteuid(0) == 0);
  chmod(file.c_str(), 0600);
  setenv("PATH", folder.c_str(), 1);
  EXPECT_EQ(prepareError(folder), "Cannot read the journal: journalctl is not installed");
  write("journalctl", "#!/bin/sh\necho Oh no >&2\necho more >&2\nexit 1\n", 0755);
  EXPECT_EQ(prepareError(folder), "journalctl failed: Oh no");
  write("journalctl", "#!/bin/sh\nexec /bin/sleep 1000\n", 0755);
  EXPECT_THROW(host::prepareLog(folder, 20ms), std::runtime_error);
}

TEST_F(LogStore, AJournalctlThatFailsIsNoEndOfTheLog) {
  write("x.journal", "");
  write("log", kDate + "_COMM=a\n\n");
  for (const auto& row : readTable("journalctl", 3)) {
    installJournalctl(row[0]);
    const Delivered delivered = run(stream(folder), std::stoul(row[2]));
    EXPECT_EQ(delivered.events.size(), 1) << row[0];
    EXPECT_EQ(delivered.reason, std::stoul(row[1])) << row[0];
  }
}

TEST_F(LogStore, JournalctlDoesNotOutliveTheProcess) {
  write("x.journal", "");
  installJournalctl("echo $$ > id; mv id pid; exec sleep 1000");
  const auto exitWhileItRuns = [this] {
    stream(folder)->activateStreamFromDate(OSLogDate(0));
    while (access((folder + "/pid").c_str(), F_OK) != 0) std::this_thread::yield();
    std::exit(3);
  };
  EXPECT_EXIT(exitWhileItRuns(), testing::ExitedWithCode(3), "");
  const auto status = "/proc/" + std::to_string(std::stoi(readFile(folder + "/pid"))) + "/stat";
  const auto isGone = [&status] {  // or waits for the system to reap it
    const auto text = readFile(status);
    return text.empty() || text.find(") Z ") != std::string::npos;
  };
  while (!isGone()) std::this_thread::yield();
}

TEST_F(LogStore, JournalctlIsAskedForLittleMoreThanIsWanted) {
  write("x.journal", "");
  installJournalctl("for word; do echo \"$word\"; done > words");
  const std::string common = "--quiet\n--no-pager\n--output=export\n--directory=" + folder + "\n";
  const auto check = [&](OSLogOrPredicate filter, std::int64_t from, const std::string& more) {
    const auto asked = stream(folder);
    asked->setFilterPredicate(std::move(filter));
    run(asked, 0, OSLogDate(from));
    EXPECT_EQ(readFile(folder + "/words"), common + more);
  };
  check({{{"process == %@", "a"}, {"process == %@", "a-long-process-name"}}}, 1'999'999,
        "--since=@1\n_COMM=a\n_COMM=a-long-process-\n+\nSYSLOG_IDENTIFIER=a\n"
        "SYSLOG_IDENTIFIER=a-long-process-name\n");
  check({{{"process == %@", "a"}, {"senderImagePath CONTAINS[cd] %@", "b"}}}, 0, "");
  check({{{"process == %@", "\uFFFD"}}}, -5'000'000, "");
}

TEST_F(LogStore, RealJournalFilesGiveWhatTheyWereMadeFrom) {
  const std::string writer = "/lib/systemd/systemd-journal-remote";
  if (access(writer.c_str(), X_OK) != 0 || system("journalctl --version >/dev/null 2>&1") != 0) {
    GTEST_SKIP() << "no systemd-journal-remote or journalctl";
  }
  const auto entryOf = [](int i) {
    const std::string number = std::to_string(10 + i);
    return "__REALTIME_TIMESTAMP=17000000" + number + "000000\n__MONOTONIC_TIMESTAMP=" + number +
           "\n_BOOT_ID=0123456789abcdef0123456789abcdef\n_PID=" + number +
           (i % 2 == 0 ? "\n_COMM=a-long-process-\n_EXE=/x/a-long-process-name" : "\n_COMM=b") +
           (i % 3 == 0 ? "\nSYSLOG_IDENTIFIER=a-long-process-\n" : "\n") +
           binary("MESSAGE", "line\n\nMESSAGE=" + number) + "\n";
  };
  std::string text;
  for (int i = 0; i < 60; ++i) text += entryOf(i);
  const std::string log = write("log", text);
  const std::string make = writer + " -o " + folder + "/x.journal " + log + " 2>/dev/null";
  ASSERT_EQ(system(make.c_str()), 0);
  for (const char* name : {"", "a-long-process-", "a-long-process-name", "b", "none"}) {
    const auto deliver = [name](const auto& from) {
      if (*name != 0) from->setFilterPredicate({{{"process == %@", name}}});
      return run(from, 0, OSLogDate(1'700'000'020'000'000));
    };
    const Delivered recorded = deliver(stream(log));
    const Delivered journal = deliver(stream(folder));
    EXPECT_EQ(recorded.events, journal.events) << name;
    EXPECT_EQ(journal.reason, kOSLogEventStreamEndOfLog) << name;
  }
}

}  // namespace
