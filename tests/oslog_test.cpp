// The exporter over a log store that each test scripts.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <functional>
#include <mutex>
#include <new>
#include <thread>

#include "framework/WordList.h"
#include "logdump/OsLogCommand.h"
#include "oslog/OsLogStream.h"
#include "platform/oslog_store.h"
#include "platform/posix/Descriptor.h"
#include "platform/system.h"
#include "tests/Program.h"
#include "tests/Table.h"

struct OsLogStreamClock {
  static bool put(std::chrono::nanoseconds timeout, const std::string& path) {
    return OsLogStream::putWithin(timeout, path, {}, {}, 0);
  }
};

namespace {

using namespace std::chrono_literals;

struct Fields {
  std::uint32_t kind = 1024;
  std::int64_t at = 0;
  std::int32_t zone = 0;
  std::uint64_t thread = 0;
  std::uint64_t activity = 0;
  std::int32_t pid = 0;
  std::string message = "m";
};

struct Event final : OSLogEventProxy, Fields {
  explicit Event(Fields fields) : Fields(std::move(fields)) {}
  std::uint32_t type() const override { return kind; }
  OSLogDate date() const override { return OSLogDate(at); }
  OSLogTimeZone timeZone() const override { return OSLogTimeZone(zone); }
  std::uint64_t threadIdentifier() const override { return thread; }
  std::uint64_t activityIdentifier() const override { return activity; }
  std::int32_t processIdentifier() const override { return pid; }
  std::string_view process() const override { return "proc"; }
  std::string_view sender() const override { return "image"; }
  std::string_view subsystem() const override { return "sub.sys"; }
  std::string_view category() const override { return "cat"; }
  std::string_view composedMessage() const override {
    return message != "too long" ? message : throw std::bad_alloc();
  }
};

/// What the store does in a test, and what it was asked.
struct Script {
  enum class Prepare { succeeds, fails, comesLate };
  Prepare prepare = Prepare::succeeds;
  std::vector<Fields> events = {{}};
  unsigned long reason = 5;
  bool deliversOn = false;  ///< goes on with the last event until `stopped`, invalidated or not
  std::function<void()> awaited = [] {};  ///< returns when what the test needs has been delivered
  std::string watched;                    ///< a file whose content is noted along with some calls
  std::atomic<bool> invalidated = false;
  std::atomic<bool> stopped = false;
  std::atomic<int> delivered = 0;
  std::thread thread;
  OSLogDate start{0};

  std::vector<std::string> calls;
  std::mutex mutex;
  std::vector<std::string> errors;  ///< what stands in the system log, but for the start of each
};

Script* script = nullptr;

class ScriptedStream : public OSLogEventStream {
 public:
  void setFlags(std::uint64_t flags) override {
    script->calls.push_back("flags " + std::to_string(flags) +
                            " file:" + readFile(script->watched));
  }
  void setFilterPredicate(OSLogOrPredicate predicate) override {
    std::string filter = "filter ";
    for (const auto& [format, value] : predicate.terms) filter += format + " " + value + "; ";
    script->calls.push_back(filter);
  }
  void setEventHandler(EventHandler handler) override {
    script->calls.push_back("event handler");
    onEvent = std::move(handler);
  }
  void setInvalidationHandler(InvalidationHandler handler) override {
    script->calls.push_back("invalidation handler");
    onEnd = std::move(handler);
  }
  void activateStreamFromDate(OSLogDate date) override {
    script->calls.push_back("activate");
    script->start = date;
    script->thread = std::thread([deliver = onEvent, end = onEnd] {
      for (const auto& event : script->events) deliver(Event(event));
      for (; script->deliversOn && !script->stopped; ++script->delivered) deliver(Event({}));
      end(script->invalidated ? 1 : script->reason, {});
    });
    script->awaited();
  }
  void invalidate() override { script->invalidated = true; }

 private:
  EventHandler onEvent;
  InvalidationHandler onEnd;
};

class ScriptedStore : public OSLogEventStore {
  void prepareWithCompletionHandler(PrepareHandler handler) override {
    script->calls.push_back("prepare file:" + readFile(script->watched));
    const auto succeed = [handler] { handler(std::make_shared<OSLogEventSource>(), std::nullopt); };
    if (script->prepare == Script::Prepare::comesLate) {
      script->thread = std::thread([succeed] {  // which learns of nothing else that was done
        while (!script->stopped.load(std::memory_order_relaxed)) std::this_thread::yield();
        succeed();
      });
    }
    if (script->prepare == Script::Prepare::fails) handler(nullptr, "locked");
    if (script->prepare == Script::Prepare::succeeds) succeed();
  }
};

class OsLogStreamTest : public ::testing::Test, public Script {
 protected:
  OsLogStreamTest() {
    script = this;
    watched = output = folder.path("out");
  }
  ~OsLogStreamTest() override {
    stopped = true;
    if (thread.joinable()) thread.join();
  }

  bool put(std::chrono::nanoseconds timeout = 60s) {
    return OsLogStreamClock::put(timeout, output);
  }

  ScratchFolder folder;
  std::string output;
  const std::string line = "1970-01-01 00:00:00 +0000 0x00000 0x0 0 proc(image):sub.sys [cat] m\n";
};

using Texts = std::vector<std::string>;

TEST_F(OsLogStreamTest, TakesItsStepsInOrder) {
  writeFile(output, "old");
  ASSERT_EQ(chmod(output.c_str(), 0640), 0);
  const auto before = OSLogDate::now();
  EXPECT_TRUE(OsLogStream::putOsLogStreamToFile(output, {"p1", "p2"}, {"I"}, 3600));
  EXPECT_EQ(calls,
            (Texts{"prepare file:old", "flags 21 file:",
                   "filter process == %@ p1; process == %@ p2; senderImagePath CONTAINS[cd] %@ I; ",
                   "event handler", "invalidation handler",
                   "Getting oslog stream: history = 3600.000000", "activate"}));
  EXPECT_GE(start, before.addingSeconds(-3600));
  EXPECT_LE(start, OSLogDate::now().addingSeconds(-3600));
  EXPECT_EQ(readFile(output), line);
  EXPECT_EQ(std::filesystem::status(output).permissions(), std::filesystem::perms(0640));
}

TEST_F(OsLogStreamTest, IsStartedByTheCommandWithItsWords) {
  const std::string history = "Getting oslog stream: history = ";
  forEachRow("oslog-command", 3, [&](const Row& row) {
    calls.clear();
    auto words = convertLineToList(row[0]);
    std::ranges::replace(words, "OUT", output);
    const auto group = dispatch::group::create();
    EXPECT_TRUE(OsLogHandler()(group, words));
    EXPECT_TRUE(group.wait(0ns));
    std::string asked;
    for (const auto& call : calls) {
      if (call.starts_with("filter")) asked += call;
      if (call.starts_with(history)) asked += call.substr(history.size());
    }
    EXPECT_EQ(asked, row[1] + row[2]);
    thread.join();
  });
}

TEST_F(OsLogStreamTest, WritesOneLineForEachMessage) {
  const auto message = std::string(100'000, 'x') + "ü";
  events = {{.kind = 1023},
            {1024, 1'700'000'000'999'999, -5400, 0x1a, 0xABCDEF, -1, "two\nlines"},
            {1024, -1, 0, ~0ULL, ~0ULL, 2147483647, message},
            {.kind = 0}};
  EXPECT_TRUE(put());
  EXPECT_EQ(readFile(output),
            "2023-11-14 20:43:20 +0000 0x0001a 0xabcdef -1 proc(image):sub.sys [cat] two\nlines\n"
            "1969-12-31 23:59:59 +0000 0xffffffffffffffff 0xffffffffffffffff 2147483647 "
            "proc(image):sub.sys [cat] " +
                message + "\n");
  EXPECT_EQ(std::filesystem::status(output).permissions(), std::filesystem::perms(0600));
  EXPECT_EQ(errors, Texts());
}

TEST_F(OsLogStreamTest, NamesWhatKeepsItFromStarting) {
  prepare = Prepare::fails;
  EXPECT_FALSE(put());
  EXPECT_EQ(errors, (Texts{"Could not open: locked", "Failed to prepare oslog stream"}));
  EXPECT_NE(access(output.c_str(), F_OK), 0) << "the file is made only for a stream";
  errors.clear();
  prepare = Prepare::comesLate;
  EXPECT_FALSE(put());
  stopped.store(true, std::memory_order_relaxed);
  thread.join();
  EXPECT_EQ(errors, Texts{"Failed to prepare oslog stream"});
  prepare = Prepare::succeeds;
  const int sealed = memfd_create("", MFD_CLOEXEC | MFD_ALLOW_SEALING);
  const auto onlyGrowing = "/proc/self/fd/" + std::to_string(sealed);
  writeFile(onlyGrowing, "old");
  ASSERT_EQ(fcntl(sealed, F_ADD_SEALS, F_SEAL_SHRINK), 0);
  for (const auto& path : {folder.path("no/such"), onlyGrowing, output + std::string("\0cut", 4)}) {
    errors.clear();
    EXPECT_FALSE(OsLogStreamClock::put(60s, path));
    EXPECT_EQ(errors, Texts{"Failed to create file: " + path});
  }
  EXPECT_EQ(readFile(onlyGrowing), "old");
  close(sealed);
}

TEST_F(OsLogStreamTest, TellsWhatEndsItEarly) {
  reason = 7;
  EXPECT_TRUE(put()) << "the log store ended the stream, for whatever reason";
  EXPECT_EQ(errors, Texts{"Invalid oslog stream: reason = 7"});
  thread.join();
  events.resize(3);
  for (const auto& [path, message, why] :
       {std::array{"/dev/full", "m", "No space left on device"},
        std::array{"/dev/null", "too long", "Cannot allocate memory"}}) {
    errors.clear();
    output = path;
    events[0].message = message;
    EXPECT_FALSE(put());
    EXPECT_EQ(errors, (Texts{"Failed to write file: " + output + ": " + why,
                             "Invalid oslog stream: reason = 1"}));
    invalidated = false;
    thread.join();
  }
}

TEST_F(OsLogStreamTest, GivesUpOnAStreamThatDoesNotEndAndWritesNoMoreOfIt) {
  deliversOn = true;
  awaited = [this] {
    while (delivered == 0) std::this_thread::yield();
  };
  EXPECT_FALSE(put(0ns));
  EXPECT_TRUE(invalidated);
  const auto written = readFile(output);
  for (const int before = delivered; delivered < before + 1000;) std::this_thread::yield();
  stopped = true;
  thread.join();
  const auto later = readFile(output);
  EXPECT_LE(later.size(), written.size() + line.size()) << "but for a line that was under way";
  EXPECT_TRUE(later.ends_with(line));
  std::ranges::sort(errors);  // written by two threads
  EXPECT_EQ(errors, (Texts{"Invalid oslog stream: reason = 1", "Timeout on getting oslog stream"}));
}

TEST_F(OsLogStreamTest, WritesToAPipeAndDoesNotHangOnItsReader) {
  output = folder.path("pipe");
  ASSERT_EQ(mkfifo(output.c_str(), 0600), 0);
  const int reader = open(output.c_str(), O_RDONLY | O_NONBLOCK);
  events.resize(2);
  events[0].message.assign(1 << 20, 'x');
  awaited = [reader] {
    pollfd readable = {reader, POLLIN, 0};
    EXPECT_EQ(poll(&readable, 1, 60'000), 1);
  };
  EXPECT_FALSE(put(0ns));
  fcntl(reader, F_SETFL, 0);
  std::string text;
  char piece[65536];
  ssize_t length = 0;
  while ((length = read(reader, piece, sizeof piece)) > 0) {
    text.append(piece, static_cast<std::size_t>(length));
  }
  const auto whole = line.substr(0, line.size() - 2) + events[0].message + "\n";
  EXPECT_TRUE(text == whole) << "the line under way, and none after it: " << text.size();
  close(reader);
}

}  // namespace

std::shared_ptr<OSLogEventStore> OSLogEventStore::localStore() {
  return std::make_shared<ScriptedStore>();
}

std::shared_ptr<OSLogEventStream> OSLogEventStream::initWithSource(
    std::shared_ptr<OSLogEventSource> /*source*/) {
  return std::make_shared<ScriptedStream>();
}

void platform::logError(const std::string& message) {
  const std::lock_guard lock(script->mutex);
  (message.starts_with("Getting ") ? script->calls : script->errors).push_back(message);
}

bool posix::isReadByDevice(const std::string& /*path*/) { return false; }
