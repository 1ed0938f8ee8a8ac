#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <limits>
#include <stdexcept>
#include <thread>

#include "platform/host/Device.h"
#include "platform/host/EntryReader.h"
#include "platform/host/EventFilter.h"
#include "platform/host/FoldedText.h"
#include "platform/host/LogEvent.h"
#include "platform/host/LogSource.h"
#include "platform/host/ProcessName.h"
#include "platform/host/StreamEnd.h"
#include "platform/host/Utf8.h"
#include "platform/oslog_store.h"

using namespace std::chrono_literals;
using namespace std::string_literals;
using host::EntryReader;
using Texts = std::vector<std::string>;
namespace fs = std::filesystem;

namespace {

const std::string kDate = "__REALTIME_TIMESTAMP=1700000000000000\n";

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
  const std::string all =
      "LOG_TYPE=7\nTID=1\n_PID=2\nSYSLOG_PID=3\nLOG_ACTIVITY=4\n_COMM=c\n_EXE=/x/e\n"
      "SYSLOG_IDENTIFIER=i\nLOG_SENDER_PATH=/y/s\nLOG_SUBSYSTEM=b\n_SYSTEMD_UNIT=u\n"
      "_TRANSPORT=t\nLOG_CATEGORY=g\nMESSAGE=m\nLOG_GMTOFF=-3600\n";
  struct Case {
    std::string fields, event;
  };
  const std::vector<Case> cases = {
      {all, "7 1 4 2|c|s|b|g|m@-3600"},
      {"MESSAGE=m\n", "1024 0 0 0|||||m@0"},
      {"_PID=2\nSYSLOG_PID=3\n_EXE=/x/e\nSYSLOG_IDENTIFIER=i\n_SYSTEMD_UNIT=u\n_TRANSPORT=t\n",
       "1024 2 0 2|i|e|u|i|@0"},
      {"SYSLOG_PID=3\n_COMM=c\n_TRANSPORT=t\n", "1024 0 0 3|c|c|t||@0"},
      {"_COMM=c\n_EXE=/x/\n", "1024 0 0 0|c|c|||@0"},
      {"_COMM=a-long-process-\n_EXE=/x/a-long-process-name\n",
       "1024 0 0 0|a-long-process-name|a-long-process-name|||@0"},
      {"_COMM=a-long-process\n_EXE=/x/a-long-process-name\n",
       "1024 0 0 0|a-long-process|a-long-process-name|||@0"},
      {"_COMM=long-process-na\n_EXE=/x/long-process-name\n",
       "1024 0 0 0|long-process-name|long-process-name|||@0"},
      {"LOG_SUBSYSTEM=\n_SYSTEMD_UNIT=u\n", "1024 0 0 0|||||@0"},
      {"LOG_TYPE=1x\nTID=-1\n_PID=2147483648\nSYSLOG_PID=3\nLOG_ACTIVITY=\nLOG_GMTOFF=86401\n",
       "1024 2147483648 0 3|||||@0"},
      {"LOG_GMTOFF=86400\n_COMM=\xFF\nMESSAGE=a\xE2\x82z\n",
       "1024 0 0 0|\uFFFD|\uFFFD|||a\uFFFDz@86400"},
  };
  for (const auto& test : cases) {
    const std::string log = kDate + test.fields + '\n';
    Pieces source(log, 1);
    EntryReader reader(source);
    ASSERT_EQ(reader.next(), EntryReader::Result::entry);
    EXPECT_EQ(summary(host::LogEvent(reader.entry())), test.event) << test.fields;
  }
}

TEST(RecordedLog, DeliversWhatIsWholeAndTellsDamage) {
  const std::string good = kDate + "MESSAGE=m\n\n";
  const std::string forged = "x\n\nMESSAGE=forged\n" + kDate + "\n";
  struct Case {
    std::string log;
    Texts seen;
  };
  const std::vector<Case> cases = {
      {"", {"end"}},
      {"\n\n" + good + "\n" + good, {"m", "m", "end"}},
      {"-- Reboot --\n" + good + "-- Boot 1 --\n" + good, {"m", "m", "end"}},
      {"MESSAGE=a\nMESSAGE=b\n" + kDate + kDate + "MESSAGE=c\n\n", {"a", "end"}},
      {kDate + binary("MESSAGE", forged) + "\n" + good, {forged, "m", "end"}},
      {kDate + binary("OTHER", forged) + binary("MESSAGE", "") + "\n", {"", "end"}},
      {"MESSAGE=a\n\n__REALTIME_TIMESTAMP=x\n\n__REALTIME_TIMESTAMP=-1\n\n" + good, {"m", "end"}},
      {"__REALTIME_TIMESTAMP=253402300799999999\n\n", {"", "end"}},
      {"__REALTIME_TIMESTAMP=253402300800000000\n\n", {"end"}},
      {good + "-- cut", {"m", "cut off in an entry"}},
      {good + "-x\n" + good, {"m", "not a field name"}},
      {kDate + "-- Reboot --\n\n", {"not a field name"}},
      {good + "=x\n\n", {"m", "not a field name"}},
      {good + "text=x\n\n", {"m", "not a field name"}},
      {good + std::string(255, 'A') + "=x\n\n", {"m", "end"}},
      {good + std::string(256, 'A') + "=x\n\n", {"m", "a field name is too long"}},
      {good + kDate + binary("MESSAGE", "xyz", 2) + "\n",
       {"m", "no newline behind a binary field"}},
      {good + binary("X", "", EntryReader::kMaxField + 1), {"m", "a field is too long"}},
      {good + binary("X", "", ~0ULL), {"m", "a field is too long"}},
  };
  for (const auto& test : cases) {
    EXPECT_EQ(readAll(test.log), test.seen) << test.log;
    EXPECT_EQ(readAll(test.log, 1), test.seen) << test.log;
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
  const Texts tooLong = {"a field is too long"};
  EXPECT_EQ(readAll(kDate + "MESSAGE=" + most + "v\n\n"), tooLong);
  EXPECT_EQ(readAll(kDate + "X=" + most + "v\n\n"), tooLong);
  EXPECT_EQ(readAll(kDate + "_EXE=" + most + "\n_COMM=" + most + "\nMESSAGE=" + most + "\n\n"),
            Texts{"an entry is too long"});
}

TEST(Text, Utf8IsRepairedByMaximalSubparts) {
  struct Case {
    std::string bytes, text;
  };
  const std::vector<Case> cases = {
      {"seven b\xC3\xA9", "seven b\xC3\xA9"},
      {"\xF4\x8F\xBF\xBF", "\xF4\x8F\xBF\xBF"},
      {"a\x80z", "a\uFFFDz"},
      {"\xC0\xAF", "\uFFFD\uFFFD"},
      {"\xE0\x9F\x80", "\uFFFD\uFFFD\uFFFD"},
      {"\xED\xA0\x80", "\uFFFD\uFFFD\uFFFD"},
      {"\xF0\x9F\x98z", "\uFFFDz"},
      {"\xF4\x90\x80\x80", "\uFFFD\uFFFD\uFFFD\uFFFD"},
      {"12345678\xE2\x82", "12345678\uFFFD"},
      {"\xF5", "\uFFFD"},
  };
  for (const auto& test : cases) {
    std::string storage;
    EXPECT_EQ(host::asUtf8(test.bytes, storage), test.text);
    EXPECT_EQ(host::isUtf8(test.bytes), test.bytes == test.text) << test.text;
  }
}

TEST(Text, FoldingIgnoresCaseAndDiacritics) {
  struct Case {
    const char *fragment, *text;
    bool contained;
  };
  const std::vector<Case> cases = {
      {"Modemcore", "/usr/lib/modemcore/x", true},
      {"modem", "/x/MODEM", true},
      {"modemx", "/x/modem", false},
      {"", "", true},
      {"\u0301", "", true},
      {"é", "E\u0301", true},
      {"e", "/\u00C9/", true},
      {"e\u0301a", "ÉÀ", true},
      {"Łódź", "/LODZ", true},
      {"ø", "o", true},
      {"ẞ", "ß", true},
      {"ß", "ss", false},
      {"Æ", "ǽ", true},
      {"æ", "ae", false},
      {"\u0253", "\u0181", true},
      {"ẚỹ", "AY", true},
      {"Ж", "ж", false},
      {"\xFF", "\uFFFD", true},
      {"@", "`", false},
      {"z", "Z\u0370", true},
  };
  for (const auto& test : cases) {
    EXPECT_EQ(host::FoldedText(test.fragment).isIn(test.text), test.contained) << test.fragment;
  }
}

TEST(Text, DatesHaveTheirDefaultForm) {
  using Limits = std::numeric_limits<std::int64_t>;
  struct Case {
    std::int64_t microseconds;
    const char* text;
  };
  const std::vector<Case> cases = {
      {0, "1970-01-01 00:00:00 +0000"},
      {-1, "1969-12-31 23:59:59 +0000"},
      {951'868'799'999'999, "2000-02-29 23:59:59 +0000"},
      {4'107'542'400'000'000, "2100-03-01 00:00:00 +0000"},
      {253'402'300'800'000'000, "10000-01-01 00:00:00 +0000"},
      {-62'167'219'200'000'001, "-0001-12-31 23:59:59 +0000"},
      {Limits::max(), "294247-01-10 04:00:54 +0000"},
      {Limits::min(), "-290308-12-21 19:59:05 +0000"},
  };
  for (const auto& test : cases) {
    std::string text;
    OSLogDate(test.microseconds).appendDescription(text);
    EXPECT_EQ(text, test.text);
  }
  const OSLogDate date(5);
  EXPECT_EQ(date.addingSeconds(-0.29), OSLogDate(5 - 290'000));
  EXPECT_EQ(date.addingSeconds(std::nan("")), date);
  EXPECT_EQ(date.addingSeconds(INFINITY), OSLogDate(Limits::max()));
  EXPECT_EQ(date.addingSeconds(0x1p63 / 1e6), OSLogDate(Limits::max()));
  EXPECT_EQ(OSLogDate(Limits::min()).addingSeconds(-1), OSLogDate(Limits::min()));
}

TEST(Text, TheLocalZoneHasItsSummerTime) {
  // On a thread of its own, which has not asked before; and back, for the tests that follow.
  const auto inZone = [](const char* zone, auto body) {
    setenv("TZ", zone, 1);
    tzset();
    std::thread(body).join();
    unsetenv("TZ");
    tzset();
  };
  inZone("CET-1CEST,M3.5.0,M10.5.0/3", [] {
    const OSLogTimeZone local;
    EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'846'799'999'999)), 3'600);
    EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'846'800'000'000)), 7'200);
    EXPECT_EQ(OSLogTimeZone(-60).secondsFromGMT(OSLogDate(0)), -60);
  });
}

/// What a stream has delivered: the summaries, and the reason of its end.
struct Delivered {
  Texts events;
  unsigned long reason = 0;
};

class LogStore : public testing::Test {
 protected:
  LogStore() { fs::create_directories(folder); }
  ~LogStore() override {
    fs::remove_all(folder);
    host::device() = device;
    setenv("PATH", path.c_str(), 1);
  }

  std::string write(const std::string& name, const std::string& text, mode_t mode = 0644) {
    std::string file = folder + "/" + name;
    std::ofstream(file, std::ios::binary) << text;
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

  const std::string folder = testing::TempDir() + "log_store." + std::to_string(getpid());
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

TEST_F(LogStore, TheSampleHasMessagesOfTheTelephonyProcesses) {
  const auto sample = stream("sample");
  sample->setFilterPredicate({{{"process == %@", "Orvalind"}, {"process == %@", "voltd"}}});
  EXPECT_EQ(run(sample, 0, OSLogDate::now().addingSeconds(-600)).events.size(), 5);
}

TEST_F(LogStore, SaysWhyItCannotBePrepared) {
  host::device().logPrepareError = "Out of order";
  EXPECT_EQ(prepareError("sample"), "Out of order");
  host::device().logPrepareError.clear();
  EXPECT_EQ(prepareError(folder + "/none"), folder + "/none: No such file or directory");
  EXPECT_EQ(prepareError(folder), "No journal: no journal files in " + folder);

  const std::string file = write("system.journal", "", 0);
  const bool isRoot = geteuid() == 0;
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
  struct Case {
    const char* script;
    unsigned long reason;
    std::size_t stopAt;
  };
  const std::vector<Case> cases = {
      {"cat log", kOSLogEventStreamEndOfLog, 0},
      {"cat log; exit 1", host::kStreamUnreadable, 0},
      {"cat log; kill -9 $$", host::kStreamUnreadable, 0},
      {"cat log; echo ignoring a file >&2", host::kStreamUnreadable, 0},
      {"cat log; head -c 200000 /dev/zero >&2", host::kStreamUnreadable, 0},
      {"cat log; printf MESSAGE=cut", host::kStreamDamaged, 0},
      {"cat log; exec sleep 1000", host::kStreamInvalidated, 1},
      {"trap '' TERM; cat log; while :; do sleep 0.01; done", host::kStreamInvalidated, 1},
  };
  for (const auto& test : cases) {
    installJournalctl(test.script);
    const Delivered delivered = run(stream(folder), test.stopAt);
    EXPECT_EQ(delivered.events.size(), 1) << test.script;
    EXPECT_EQ(delivered.reason, test.reason) << test.script;
  }
}

TEST_F(LogStore, JournalctlIsAskedForLittleMoreThanIsWanted) {
  write("x.journal", "");
  installJournalctl("for word; do echo \"$word\"; done > words");
  const std::string common = "--quiet\n--no-pager\n--output=export\n--directory=" + folder + "\n";
  struct Case {
    std::vector<OSLogPredicate> filter;
    std::int64_t from;
    std::string words;
  };
  const std::vector<Case> cases = {
      {{{"process == %@", "a"}, {"process == %@", "a-long-process-name"}},
       1'999'999,
       "--since=@1\n_COMM=a\n_COMM=a-long-process-\n+\nSYSLOG_IDENTIFIER=a\n"
       "SYSLOG_IDENTIFIER=a-long-process-name\n"},
      {{{"process == %@", "a"}, {"senderImagePath CONTAINS[cd] %@", "b"}}, 0, ""},
      {{{"process == %@", "\uFFFD"}}, -5'000'000, ""},
  };
  for (const auto& test : cases) {
    const auto asked = stream(folder);
    asked->setFilterPredicate({test.filter});
    run(asked, 0, OSLogDate(test.from));
    std::ifstream words(folder + "/words");
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(words), {}), common + test.words);
  }
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
