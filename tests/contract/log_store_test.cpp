#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <csignal>
#include <cstdlib>
#include <functional>
#include <limits>
#include <stdexcept>
#include <thread>

#include "tests/StreamRun.h"
#include "tests/Table.h"

namespace {

struct Event {
  OSLogDate date;
  std::string process;
  std::string message;
};

class LogStore : public testing::Test {
 protected:
  void SetUp() override {
    int calls = 0;
    OSLogEventStore::localStore()->prepareWithCompletionHandler(
        [&](std::shared_ptr<OSLogEventSource> prepared, const std::optional<std::string>& why) {
          ++calls;
          source = std::move(prepared);
          EXPECT_EQ(source == nullptr, why.has_value());
          error = why.value_or("");
        });
    ASSERT_EQ(calls, 1) << "the completion runs before prepare returns";
    if (source == nullptr) GTEST_SKIP() << error;
    renew();
    ASSERT_NE(stream, nullptr);
  }

  /// Runs the stream and calls `each` with every event, until there are no more or `each` has seen
  /// what a log of any length has enough of. Then there is another stream.
  std::vector<Event> run(OSLogDate from, const std::function<void()>& each = nullptr) {
    std::vector<Event> events;
    runToItsEnd(*stream, from, [&](const OSLogEventProxy& event) {
      EXPECT_GE(event.date(), from);
      if (each) each();
      sigset_t blocked;
      pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
      EXPECT_EQ(sigismember(&blocked, SIGTERM), 1);
      if (events.size() == kMost) return stream->invalidate();
      events.push_back(
          {event.date(), std::string(event.process()), std::string(event.composedMessage())});
    });
    stream->invalidate();  // after its end
    renew();
    return events;
  }

  void renew() { stream = OSLogEventStream::initWithSource(source); }

  static constexpr std::size_t kMost = 1000;
  const OSLogDate tenMinutesAgo = OSLogDate::now().addingSeconds(-600);
  std::string error;
  std::shared_ptr<OSLogEventSource> source;
  std::shared_ptr<OSLogEventStream> stream;
};

TEST_F(LogStore, DeliversInOrderFromTheDateOnWhatAnyTermOfTheFilterLetsPass) {
  auto all = run(tenMinutesAgo);
  if (all.empty()) GTEST_SKIP() << "nothing has been logged for ten minutes";
  const auto wanted = all.back().process;
  const auto count = std::ranges::count(all, wanted, &Event::process);
  const OSLogDate middle = all[all.size() / 2].date;
  std::erase_if(all, [middle](const Event& event) { return event.date < middle; });
  const auto later = run(middle);
  ASSERT_GE(later.size(), all.size());
  for (std::size_t i = 0; i < all.size(); ++i) EXPECT_EQ(later[i].message, all[i].message);
  stream->setFilterPredicate({{{"process == %@", "none"}, {"process == %@", wanted}}});
  const auto some = run(tenMinutesAgo);
  EXPECT_GE(some.size(), static_cast<std::size_t>(count));
  EXPECT_TRUE(std::ranges::all_of(some, [&](const auto& one) { return one.process == wanted; }));
  stream->setFilterPredicate({});
  EXPECT_TRUE(run(tenMinutesAgo).empty()) << "no term is true";
  EXPECT_THROW(stream->setFilterPredicate({{{"pid == %@", "1"}}}), std::invalid_argument);
}

TEST_F(LogStore, IsInvalidatedFromAnywhereAndRunsOnWhenItsMakerReleasesIt) {
  run(tenMinutesAgo, [this] { stream->invalidate(); });  // from its own thread, again and again
  stream->invalidate();
  EXPECT_TRUE(run(tenMinutesAgo).empty()) << "invalidated before it was activated";
  const auto ended = dispatch::group::create();
  stream->setInvalidationHandler([member = dispatch::membership(ended)](auto, const auto&) {});
  stream->activateStreamFromDate(tenMinutesAgo);
  stream.reset();
  EXPECT_TRUE(ended.wait(std::chrono::seconds(60)));
  renew();
  const std::jthread other([last = stream] { last->invalidate(); });
  run(tenMinutesAgo);
}

TEST(Dates, HaveTheirDefaultForm) {
  using Limits = std::numeric_limits<std::int64_t>;
  forEachRow("dates", 2, [](const Row& row) {
    std::string text;
    OSLogDate(std::stoll(row[0])).appendDescription(text);
    EXPECT_EQ(text, row[1]);
  });
  const OSLogDate date(5);
  EXPECT_EQ(date.addingSeconds(-0.29), OSLogDate(5 - 290'000));
  EXPECT_EQ(date.addingSeconds(std::nan("")), date);
  EXPECT_EQ(date.addingSeconds(INFINITY), OSLogDate(Limits::max()));
  EXPECT_EQ(date.addingSeconds(0x1p63 / 1e6), OSLogDate(Limits::max()));
  EXPECT_EQ(OSLogDate(Limits::min()).addingSeconds(-1), OSLogDate(Limits::min()));
}

TEST(Dates, AreInALocalZoneWithItsSummerTime) {
  setenv("TZ", "CET-1CEST,M3.5.0/2:30:20,M10.5.0/3", 1);
  tzset();
  const OSLogTimeZone local;
  EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'848'619'999'999)), 3'600);
  EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'848'620'000'000)), 7'200);
}

}  // namespace
