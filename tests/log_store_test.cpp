#include <fcntl.h>
#include <gtest/gtest.h>
#include <malloc.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <new>
#include <sstream>

#include "fuzz/RecordedLogs.h"
#include "oslog/OsLogStream.h"
#include "platform/host/device/Device.h"
#include "platform/host/log/FoldedText.h"
#include "platform/host/log/LogEvent.h"
#include "platform/host/log/RecordedLogReader.h"
#include "platform/host/log/SampleLog.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/Utf8.h"
#include "platform/system.h"
#include "tests/FailingAllocations.h"
#include "tests/Program.h"
#include "tests/StreamRun.h"
#include "tests/Table.h"

using namespace std::chrono_literals;
using namespace std::string_literals;
using Texts = std::vector<std::string>;

namespace {

const std::string kDate = "__REALTIME_TIMESTAMP=1700000000000000\n";

const std::string kForged = "x\n\nMESSAGE=forged\n" + kDate + "\n";

/// The messages of a log, and after them how it ends.
Texts readAll(std::string_view log, std::size_t piece = 1 << 20) {
  const auto reader = host::readRecordedLog(pieces(log, piece));
  Texts seen;
  try {
    while (reader->next()) {
      seen.emplace_back(reader->entry()[host::Field::message]);
    }
    seen.emplace_back("end");
  } catch (const host::DamagedLog& damage) {
    seen.emplace_back(damage.what());
  }
  return seen;
}

/// Makes the local zone one that is neither GMT nor the machine's.
void moveEast() {
  setenv("TZ", "EAST-1", 1);
  tzset();
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
  moveEast();
  forEachRow("event-fields", 2, [](const Row& row) {
    const std::string log = kDate + row[0] + '\n';
    const auto reader = host::readRecordedLog(pieces(log, 1));
    ASSERT_TRUE(reader->next());
    std::string texts;
    EXPECT_EQ(summary(host::LogEvent(reader->entry(), texts)), row[1]);
  });
}

TEST(RecordedLog, DeliversWhatIsWholeAndTellsDamage) {
  const std::map<char, std::string> parts = {{'D', kDate},
                                             {'G', kDate + "MESSAGE=m\n\n"},
                                             {'N', std::string(255, 'A')},
                                             {'F', binary("MESSAGE", kForged)},
                                             {'O', binary("OTHER", kForged)},
                                             {'S', binary("MESSAGE", "xyz", 2)},
                                             {'L', binary("X", "", ~0ULL)}};
  forEachRow("damage", 2, [&parts](const Row& row) {
    std::string log;
    for (std::size_t i = 0; i < row[0].size(); ++i) {
      log += row[0][i] == '%' ? parts.at(row[0][++i]) : row[0].substr(i, 1);
    }
    for (const std::size_t piece : {std::size_t{1}, log.size() + 1}) {
      std::string seen;
      for (const auto& text : readAll(log, piece))
        seen += (text == kForged ? "FORGED" : text) + "; ";
      EXPECT_EQ(seen, row[1] + "; ");
    }
  });
}

TEST(RecordedLog, LongFieldsAreWholeUpToTheCap) {
  const auto logOf = [](const std::string& value) {
    const std::string name = "_COMM=c\nMESSAGE";
    return kDate + binary(name, value) + binary("X", value) + "\n" + kDate + name + "=" + value +
           "\nX=" + value + "\n\n";
  };
  constexpr std::size_t kMost = 32 << 20;
  std::vector<std::size_t> sizes = {kMost};
  for (std::size_t off = 0; off < 120; ++off) sizes.push_back(host::kRecordedLogBuffer - off);
  for (const std::size_t size : sizes) {
    const std::string value(size, 'v');
    ASSERT_TRUE(readAll(logOf(value)) == (Texts{value, value, "end"})) << size;
  }
  const std::string most(kMost, 'v');
  EXPECT_EQ(readAll(kDate + "X=" + most + "v\n" + binary("Y", most + "v") + "\n"),
            (Texts{"", "end"}));
  EXPECT_EQ(readAll(kDate + "MESSAGE=" + most + "v\n\n"),
            Texts{"damaged at byte 33554432: a field is too long"});
  EXPECT_EQ(readAll(kDate + "_EXE=" + most + "\n_COMM=" + most + "\nMESSAGE=" + most + "\n\n"),
            Texts{"damaged at byte 67108864: an entry is too long"});
}

TEST(RecordedLog, TheSampleIsOne) {
  EXPECT_EQ(host::sampleLog(OSLogDate(1'000'000'000)),
            readFile(ZUBTOOL_SOURCES "/tests/data/sample.export"));
}

TEST(Text, Utf8IsRepairedByMaximalSubparts) {
  forEachRow("utf8", 2, [](const Row& row) {
    std::string storage;
    EXPECT_EQ(posix::asUtf8(row[0], storage), row[1]);
    EXPECT_EQ(posix::isUtf8(row[0]), row[0] == row[1]);
  });
}

TEST(Text, FoldingIgnoresCaseAndDiacritics) {
  forEachRow("folding", 3, [](const Row& row) {
    EXPECT_EQ(host::FoldedText(row[0]).isIn(row[1]), row[2] == "true");
  });
}

// The reasons of the manual page.
constexpr unsigned long kInvalidated = 1;
constexpr unsigned long kDamaged = 2;
constexpr unsigned long kUnreadable = 3;

/// What a stream has delivered: the summaries, and the reason of its end.
struct Delivered {
  Texts events;
  unsigned long reason = 0;
};

class LogStore : public testing::Test {
 protected:
  LogStore() { moveEast(); }

  ~LogStore() override {
    prepared.reset();
    closelog();  // which syslog(3) has opened
    EXPECT_EQ(openDescriptors(), descriptors) << "what has been opened is closed";
    host::device() = device;
  }

  std::string write(const std::string& name, const std::string& text, mode_t mode = 0644) {
    std::string file = scratch.path(name);
    writeFile(file, text);
    chmod(file.c_str(), mode);
    return file;
  }

  std::string prepareError(const std::string& log) {
    std::optional<std::string> error;
    host::device().log = log;
    OSLogEventStore::localStore()->prepareWithCompletionHandler([&](auto source, const auto& why) {
      prepared = source;
      EXPECT_EQ(source == nullptr, (error = why).has_value());
    });
    return error.value_or("none");
  }

  /// Exports `log`, of `lines` lines, with each allocation failing in turn.
  static void starve(const std::string& log, std::ptrdiff_t lines) {
    host::device().log = log;
    const ScratchFolder elsewhere;
    const std::string file = elsewhere.path("export");
    bool succeeded = false;
    const auto put = [&] {
      succeeded = OsLogStream::putOsLogStreamToFile(file, {"nobody"}, {"/É"}, 4e9);
    };
    for (int nth = 1; failAllocation(nth, put); ++nth) {
    }
    EXPECT_TRUE(succeeded);
    EXPECT_EQ(std::ranges::count(readFile(file), '\n'), lines);
  }

  static std::ptrdiff_t openDescriptors() {
    return std::ranges::distance(std::filesystem::directory_iterator("/proc/self/fd"));
  }

  std::shared_ptr<OSLogEventStream> stream(const std::string& log) {
    EXPECT_EQ(prepareError(log), "none");
    return OSLogEventStream::initWithSource(prepared);
  }

  static constexpr auto ignore = [](std::size_t) {};

  /// Runs a stream to its end; `onEvent` is called with the number of each event.
  static Delivered run(const std::shared_ptr<OSLogEventStream>& from,
                       const std::function<void(std::size_t)>& onEvent = ignore,
                       OSLogDate date = OSLogDate(0)) {
    Delivered delivered;
    delivered.reason = runToItsEnd(*from, date, [&](const OSLogEventProxy& event) {
      delivered.events.push_back(summary(event));
      onEvent(delivered.events.size());
    });
    return delivered;
  }

  /// Likewise; it is invalidated by its event number `stopAt`.
  static Delivered run(const std::shared_ptr<OSLogEventStream>& from, std::size_t stopAt) {
    return run(from, [&](std::size_t number) {
      if (number == stopAt) from->invalidate();
    });
  }

  const ScratchFolder scratch;
  const std::string folder = std::filesystem::path(scratch.path("file")).parent_path();
  const std::ptrdiff_t descriptors = openDescriptors();
  std::shared_ptr<OSLogEventSource> prepared;  ///< by the last call of prepareError()
  const host::Profile device = host::device();
};

TEST_F(LogStore, DeliversWhatIsWantedInItsOrderAndEndsAsTheProfileSays) {
  const std::string log =
      write("log",
            "__REALTIME_TIMESTAMP=3000000\n_COMM=a\nMESSAGE=3\n\n__REALTIME_TIMESTAMP=2000000\n"
            "_COMM=a\n\n__REALTIME_TIMESTAMP=2000001\n_COMM=b\n_EXE=/A/É\nMESSAGE=2\n\n"
            "__REALTIME_TIMESTAMP=4000000\n_COMM=ab\n\n");
  const auto wanted = stream(log);
  wanted->setFilterPredicate(
      {{{"process == %@", "a"}, {"senderImagePath CONTAINS[cd] %@", "a/e"}}});
  Delivered delivered = run(wanted, ignore, OSLogDate(2'000'001));
  EXPECT_EQ(delivered.events, (Texts{"1024 0 0 0|a|a|||3@3600", "1024 0 0 0|b|É|||2@3600"}));
  EXPECT_EQ(delivered.reason, kOSLogEventStreamEndOfLog);
  const auto again = OSLogEventStream::initWithSource(prepared);
  EXPECT_EQ(run(again, ignore, OSLogDate(2'000'001)).events.size(), 3U) << "without a filter";

  host::device().logEnd = 9;
  EXPECT_EQ(run(stream(log)).reason, 9);
  EXPECT_EQ(run(stream(write("cut", kDate))).reason, kDamaged);
  const auto truncated = stream(write("shorter", kDate + "\n" + kDate + "\n"));
  std::filesystem::resize_file(folder + "/shorter", kDate.size() + 1);
  EXPECT_EQ(run(truncated).reason, kUnreadable);
  host::device().logEnd = std::nullopt;
  delivered = run(stream(log), 4);  // stays open after the last event
  EXPECT_EQ(delivered.events.size(), 4);
  EXPECT_EQ(delivered.reason, kInvalidated);
}

TEST_F(LogStore, ReadsOnWhileAnEventIsHandledUntilItIsInvalidatedOrThatFails) {
  const std::string pipe = folder + "/pipe";
  ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
  const auto blocked = stream(pipe);  // does not wait for a writer
  std::ofstream writer(pipe);
  writer << kDate << "\n" << std::flush;
  const int reader = open(pipe.c_str(), O_RDONLY | O_NONBLOCK);
  int unread = 1;
  const auto logMoreAndStop = [&](std::size_t) {
    writer << kDate << "\n" << std::flush;
    const auto end = std::chrono::steady_clock::now() + 10s;
    while (unread > 0 && std::chrono::steady_clock::now() < end) ioctl(reader, FIONREAD, &unread);
    blocked->invalidate();
  };
  EXPECT_EQ(run(blocked, logMoreAndStop).reason, kInvalidated);
  EXPECT_EQ(unread, 0);
  const auto failing = stream(pipe);
  writer << kDate << "\n" << std::flush;  // and the reading thread waits for more
  const auto fail = [](std::size_t) { throw std::bad_alloc(); };
  EXPECT_EQ(run(failing, fail).reason, kUnreadable);
  close(reader);
}

TEST_F(LogStore, HoldsTextsOfAnySizeAsLongAsTheyAreInHand) {
  constexpr std::size_t kHuge = 20'000'000;
  const auto textOf = [](std::size_t i) {
    return std::string(i == 8 ? kHuge : 100'000, "abcde"[i % 5]);
  };
  std::string text;
  for (std::size_t i = 0; i < 40; ++i) text += kDate + "MESSAGE=" + textOf(i) + "\n\n";
  const std::string log = write("log", std::exchange(text, {}));
  const auto inUse = [] { return mallinfo2().uordblks + mallinfo2().hblkhd; };
  std::size_t seen = 0;
  std::size_t held = 0;
  const auto before = inUse();
  runToItsEnd(*stream(log), OSLogDate(0), [&](const OSLogEventProxy& event) {
    EXPECT_TRUE(event.composedMessage() == textOf(seen)) << seen;
    if (++seen == 40) held = inUse() - before;
  });
  EXPECT_EQ(seen, 40U);
  EXPECT_LT(held, kHuge / 2);
  EXPECT_EQ(run(stream(log), 1).reason, kInvalidated) << "while it reads ahead";
}

TEST_F(LogStore, OutlivesEachAllocationOfAnExportThatFails) {
  const std::string fields = "_COMM=a-long-process-\n_EXE=/É/a-long-process-name\nMESSAGE=";
  const std::string message = std::string(300'000, 'm') + "\xFF and no more";
  starve(write("log", kDate + fields + message + "\n\nthe end, which is reported"), 1);
}

TEST_F(LogStore, NothingThatIsReadIsAnOutput) {
  const std::string sub = folder + "/01234567-89AB-cdef-0123-456789abcdef";
  const ScratchFolder elsewhere;
  std::filesystem::create_directories(sub + "/deeper");
  const std::string file = sub + "/x.journal";
  writeFile(file, "kept");
  std::filesystem::create_hard_link(file, elsewhere.path("same"));
  std::filesystem::create_symlink(file, elsewhere.path("link"));
  std::filesystem::create_symlink(folder + "/new", elsewhere.path("dangling"));
  const posix::Descriptor opened(open(file.c_str(), O_RDONLY));
  const std::string byNumber = "/proc/self/fd/" + std::to_string(opened.get());
  host::device().log = folder;
  for (const auto& path : {file, folder + "/new", sub + "/../new", byNumber, elsewhere.path("same"),
                           elsewhere.path("link"), elsewhere.path("dangling")}) {
    EXPECT_EQ(platform::FileHandle::createEmpty(path), nullptr) << path;
    EXPECT_EQ(readFile(file), "kept") << path;
  }
  EXPECT_FALSE(posix::isReadByDevice(elsewhere.path("new")));
  EXPECT_FALSE(posix::isReadByDevice(sub + "/deeper/new"));
  host::device().log = file;
  EXPECT_TRUE(posix::isReadByDevice(elsewhere.path("link")));
  EXPECT_FALSE(posix::isReadByDevice(folder + "/new"));
  host::device().log = "sample";
  host::device().file = file;  // the profile
  EXPECT_TRUE(posix::isReadByDevice(elsewhere.path("link")));
}

TEST_F(LogStore, SaysWhyItCannotBePrepared) {
  host::device().logPrepareError = "Out of order";
  EXPECT_EQ(prepareError("sample"), "Out of order");
  host::device().logPrepareError.clear();
  EXPECT_EQ(prepareError(folder + "/none"), folder + "/none: No such file or directory");
  EXPECT_EQ(prepareError(folder), "No journal: no journal files in " + folder);

  const std::string file = folder + "/system.journal";
  std::filesystem::create_symlink("/none", file);
  EXPECT_EQ(prepareError(folder),
            "Cannot read the journal: " + file + ": No such file or directory");
  std::filesystem::remove(file);
  write("system.journal", "", 0);
  const bool isRoot = geteuid() == 0;
  chmod(folder.c_str(), 0755);
  ASSERT_TRUE(!isRoot || seteuid(65534) == 0);
  EXPECT_EQ(prepareError(folder), "Cannot read the journal: " + file +
                                      ": Permission denied. Run as "
                                      "root or as a member of the group systemd-journal");
  ASSERT_TRUE(!isRoot || seteuid(0) == 0);
}

/// Journal files, made of recorded logs by systemd's own program.
class Journal : public LogStore {
 protected:
  void SetUp() override {
    if (access(kWriter, X_OK) != 0) GTEST_SKIP() << "systemd-journal-remote is not installed";
    if (prepareError(makeFile("probe", "")).find("built without") != std::string::npos) {
      GTEST_SKIP() << "built without libsystemd";
    }
    std::filesystem::remove(folder + "/probe.journal");
  }

  std::string logOf(int entries) const {
    std::string log;
    for (int i = 0; i < entries; ++i) {
      const std::string number = std::to_string(1'000'000 + i);
      const Texts kinds = {
          "_COMM=a-long-process-\n_EXE=/x/a-long-process-name\n",
          "_COMM=pr\\303\\266zess-\\303\\274n\\303\\257c\n_EXE=/x/prözess-ünïcode\n",
          "_COMM=with blank\n_EXE=/opt/Mödem Core/" + number + "\nSYSLOG_IDENTIFIER=ignored\n",
          "SYSLOG_IDENTIFIER=only an identifier\nLOG_SENDER_PATH=/lib/Ünit.so\n",
          "_COMM=\\\"q\\\\\\n\n" + binary("MESSAGE", kForged),
          "_COMM=huge\nMESSAGE=" + std::string(entries > 1'000 ? 1 : 100'000, 'm') + "\n",
          "LOG_GMTOFF=7200\n"};
      log += "__REALTIME_TIMESTAMP=1700000000" + number.substr(1) +
             "\n__MONOTONIC_TIMESTAMP=" + number + "\n_BOOT_ID=0123456789abcdef0123456789abcdef\n" +
             kinds[static_cast<std::size_t>(i) % kinds.size()] + "_PID=" + number + "\n\n";
    }
    return log;
  }

  std::string makeFile(const std::string& name, const std::string& log) {
    std::string file = folder + "/" + name + ".journal";
    const std::string make =
        std::string(kWriter) + " -o " + file + " " + write("log", log) + " >/dev/null 2>&1";
    EXPECT_EQ(system(make.c_str()), 0);
    return file;
  }

  static constexpr const char* kWriter = "/lib/systemd/systemd-journal-remote";
};

TEST_F(Journal, GivesWhatItWasMadeFromForAnyFilter) {
  const std::string id = "0123456789ABCDEF0123456789abcdef";
  std::filesystem::create_directory(scratch.path(id));
  const std::string file = makeFile(id + "/x", logOf(140));
  forEachRow("journal-filters", 2, [&](const Row& row) {
    OSLogOrPredicate filter;
    std::istringstream terms(row[0]);
    for (std::string kind; terms >> kind >> std::ws;) {
      std::string& value = filter.terms.emplace_back().value;
      filter.terms.back().format =
          kind == "process" ? "process == %@" : "senderImagePath CONTAINS[cd] %@";
      std::getline(terms, value, ',');
    }
    const auto deliver = [&](const std::string& log) {
      const auto from = stream(log);
      if (!filter.terms.empty()) from->setFilterPredicate(filter);
      return run(from, ignore, OSLogDate(1'700'000'000'000'070));
    };
    const Delivered recorded = deliver(folder + "/log");
    EXPECT_EQ(recorded.events.size(), std::stoul(row[1]));
    EXPECT_EQ(deliver(file).events, recorded.events);
    const Delivered journal = deliver(folder);
    EXPECT_EQ(journal.events, recorded.events);
    EXPECT_EQ(journal.reason, kOSLogEventStreamEndOfLog);
  });
  EXPECT_EQ(run(stream(file), 3).reason, kInvalidated);
}

TEST_F(Journal, RefusesAFileThatItCannotRead) {
  const std::string file =
      makeFile("x", kDate + "_BOOT_ID=0123456789abcdef0123456789abcdef\n_EXE=/É/x\nMESSAGE=m\n\n");
  starve(folder, 1);
  for (const auto& [text, why] : {std::pair(std::string(), "cut off"),
                                  {std::string(1000, 'x'), "no journal file, or damaged"}}) {
    write("y.journal", text);
    EXPECT_EQ(prepareError(folder), "Cannot read the journal: " + folder + "/y.journal: " + why);
  }
  std::filesystem::remove(folder + "/y.journal");
  const auto late = stream(folder);
  std::filesystem::resize_file(file, 100);
  EXPECT_EQ(run(late).reason, kUnreadable);
}

TEST_F(Journal, OutlivesFilesThatAreTruncatedWhileTheyAreRead) {
  const std::string kept = makeFile("kept", logOf(6'000));
  const std::string file = write("x.journal", readFile(kept));
  const std::uintmax_t whole = std::filesystem::file_size(kept);
  for (std::size_t i = 0; i < 20; ++i) {
    std::filesystem::copy_file(kept, file, std::filesystem::copy_options::overwrite_existing);
    const std::size_t moment = 1 + i * 150;
    const std::uintmax_t size = whole * (i * 7 % 20) / 20;
    const auto truncate = [&](std::size_t number) {
      if (number == moment) std::filesystem::resize_file(file, size);
    };
    EXPECT_EQ(run(stream(file), truncate).reason, kUnreadable) << size;
  }
  const auto fault = [](std::size_t) { raise(SIGBUS); };
  EXPECT_DEATH(run(stream(kept), fault), "") << "another's fault";
}

}  // namespace
