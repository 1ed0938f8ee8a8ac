// The exporter over a log store that each test scripts.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
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

/// The log store and its streams, which do what a test says and note what they are asked.
class OsLogStreamTest : public testing::Test, public OSLogEventStore, public OSLogEventStream {
 public:
  OsLogStreamTest() { current = this; }
  ~OsLogStreamTest() override {
    stopped = true;
    if (thread.joinable()) thread.join();
  }

  void prepareWithCompletionHandler(PrepareHandler handler) override {
    calls += "prepare file:" + readFile(folder.path("out")) + "\n";
    prepare(handler);
  }
  void setFlags(std::uint64_t flags) override {
    calls += "flags " + std::to_string(flags) + " file:" + readFile(folder.path("out")) + "\n";
  }
  void setFilterPredicate(OSLogOrPredicate predicate) override {
    calls += "filter ";
    for (const auto& [format, value] : predicate.terms) calls.append(format + " " + value + "; ");
    calls += "\n";
  }
  void setEventHandler(EventHandler handler) override {
    calls += "event handler\n";
    onEvent = std::move(handler);
  }
  void setInvalidationHandler(InvalidationHandler handler) override {
    calls += "invalidation handler\n";
    onEnd = std::move(handler);
  }
  void activateStreamFromDate(OSLogDate date) override {
    calls += "activate\n";
    start = date;
    thread = std::thread([this, deliver = std::move(onEvent), end = std::move(onEnd)] {
      for (const auto& event : events) deliver(Event(event));
      for (; deliversOn && !stopped; ++delivered) deliver(Event({}));
      end(invalidated ? 1 : reason, {});
    });
    awaited();
  }
  void invalidate() override { invalidated = true; }

  void logError(const std::string& message) {
    const std::lock_guard lock(mutex);
    (message.starts_with("Getting ") ? calls : errors) += message + "\n";
  }

  static OsLogStreamTest* current;

 protected:
  bool put(std::chrono::nanoseconds timeout = 60s) {
    return OsLogStreamClock::put(timeout, output);
  }

  ScratchFolder folder;
  std::string output = folder.path("out");
  const std::string line = "1970-01-01 00:00:00 +0000 0x00000 0x0 0 proc(image):sub.sys [cat] m\n";

  std::function<void(const PrepareHandler&)> prepare = [](const auto& handler) {
    handler(std::make_shared<OSLogEventSource>(), std::nullopt);
  };
  std::vector<Fields> events = {{}};
  unsigned long reason = 5;
  bool deliversOn = false;  ///< goes on with another event until `stopped`, invalidated or not
  std::function<void()> awaited = [] {};  ///< returns when what the test needs has been delivered
  std::atomic<bool> invalidated = false;
  std::atomic<bool> stopped = false;
  std::atomic<int> delivered = 0;
  std::thread thread;
  OSLogDate start{0};

  std::string calls;
  std::string errors;  ///< what stands in the system log, but for the start of each stream

 private:
  std::mutex mutex;
  EventHandler onEvent;
  InvalidationHandler onEnd;
};

OsLogStreamTest* OsLogStreamTest::current = nullptr;

TEST_F(OsLogStreamTest, TakesItsStepsInOrderAsTheWordsOfTheCommandSay) {
  writeFile(output, "");
  ASSERT_EQ(chmod(output.c_str(), 0640), 0);
  forEachRow("oslog-command", 3, [this](const Row& row) {
    calls.clear();
    writeFile(output, "old");
    const auto before = OSLogDate::now();
    auto words = convertLineToList(row[0]);
    std::ranges::replace(words, "OUT", output);
    const auto group = dispatch::group::create();
    EXPECT_TRUE(OsLogHandler()(group, words));
    EXPECT_TRUE(group.wait(0ns));
    EXPECT_EQ(calls, "prepare file:old\nflags 21 file:\n" + row[1] +
                         "event handler\ninvalidation handler\n"
                         "Getting oslog stream: history = " +
                         row[2] + "\nactivate\n");
    EXPECT_GE(start, before.addingSeconds(-std::stod(row[2])));
    EXPECT_LE(start, OSLogDate::now().addingSeconds(-std::stod(row[2])));
    thread.join();
    EXPECT_EQ(readFile(output), line);
  });
  EXPECT_EQ(std::filesystem::status(output).permissions(), std::filesystem::perms(0640));
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
  EXPECT_EQ(errors, "");
}

TEST_F(OsLogStreamTest, NamesWhatKeepsItFromStarting) {
  const auto succeed = prepare;
  prepare = [](const auto& handler) { handler(nullptr, "locked"); };
  EXPECT_FALSE(put());
  EXPECT_EQ(errors, "Could not open: locked\nFailed to prepare oslog stream\n");
  EXPECT_NE(access(output.c_str(), F_OK), 0) << "the file is made only for a stream";
  errors.clear();
  prepare = [&](const auto& handler) {
    thread = std::thread([&, handler] {  // which learns of nothing else that was done
      while (!stopped.load(std::memory_order_relaxed)) std::this_thread::yield();
      succeed(handler);
    });
  };
  EXPECT_FALSE(put());
  stopped.store(true, std::memory_order_relaxed);
  thread.join();
  EXPECT_EQ(errors, "Failed to prepare oslog stream\n");
  prepare = succeed;
  const int sealed = memfd_create("", MFD_CLOEXEC | MFD_ALLOW_SEALING);
  const auto onlyGrowing = "/proc/self/fd/" + std::to_string(sealed);
  writeFile(onlyGrowing, "old");
  ASSERT_EQ(fcntl(sealed, F_ADD_SEALS, F_SEAL_SHRINK), 0);
  for (const auto& path : {folder.path("no/such"), onlyGrowing, output + std::string("\0cut", 4)}) {
    errors.clear();
    EXPECT_FALSE(OsLogStreamClock::put(60s, path));
    EXPECT_EQ(errors, "Failed to create file: " + path + "\n");
  }
  EXPECT_EQ(readFile(onlyGrowing), "old");
  close(sealed);
}

TEST_F(OsLogStreamTest, TellsWhatEndsItEarly) {
  reason = 7;
  EXPECT_TRUE(put()) << "the log store ended the stream, for whatever reason";
  EXPECT_EQ(errors, "Invalid oslog stream: reason = 7\n");
  thread.join();
  events.resize(3);
  for (const auto& [path, message, why] : {std::tuple("/dev/full", "m", "No space left on device"),
                                           {"/dev/null", "too long", "Cannot allocate memory"}}) {
    errors.clear();
    output = path;
    events[0].message = message;
    EXPECT_FALSE(put());
    EXPECT_EQ(errors, "Failed to write file: " + output + ": " + why +
                          "\nInvalid oslog stream: reason = 1\n");
    invalidated = false;
    thread.join();
  }
}

TEST_F(OsLogStreamTest, GivesUpOnAStreamThatDoesNotEndAfterTheLineThatIsUnderWay) {
  output = folder.path("pipe");
  ASSERT_EQ(mkfifo(output.c_str(), 0600), 0);
  const int reader = open(output.c_str(), O_RDONLY | O_NONBLOCK);
  events[0].message.assign(1 << 20, 'x');  // more than a pipe holds
  deliversOn = true;
  awaited = [reader] {
    pollfd readable = {reader, POLLIN, 0};
    EXPECT_EQ(poll(&readable, 1, 60'000), 1);
  };
  EXPECT_FALSE(put(0ns));
  EXPECT_TRUE(invalidated);
  const auto text = readFile(output);
  const auto whole = line.substr(0, line.size() - 2) + events[0].message + "\n";
  EXPECT_TRUE(text == whole) << "the line under way, and none after it: " << text.size();
  while (delivered < 1000) std::this_thread::yield();
  stopped = true;
  thread.join();
  EXPECT_EQ(errors, "Timeout on getting oslog stream\nInvalid oslog stream: reason = 1\n");
  close(reader);
}

}  // namespace

// Nothing here is the owner of the test.
std::shared_ptr<OSLogEventStore> OSLogEventStore::localStore() {
  return {OsLogStreamTest::current, [](auto*) {}};
}

std::shared_ptr<OSLogEventStream> OSLogEventStream::initWithSource(
    std::shared_ptr<OSLogEventSource> /*source*/) {
  return {OsLogStreamTest::current, [](auto*) {}};
}

void platform::logError(const std::string& message) { OsLogStreamTest::current->logError(message); }

bool posix::isReadByDevice(const std::string& /*path*/) { return false; }
