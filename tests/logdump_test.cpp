#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <ctime>
#include <thread>

#include "logdump/TraceNames.h"
#include "logdump/TraceProperty.h"
#include "platform/host/device/Device.h"
#include "platform/host/device/Requests.h"
#include "tests/CapturedOutput.h"
#include "tests/Table.h"
#include "tool/ZUBCommand.h"

namespace {

TEST(TraceProperty, ReadsWordsAndNumbers) {
  forEachRow("trace-property", 3, [](const Row& row) {
    const auto mode = ParseTraceMode(row[0]);
    EXPECT_EQ(mode ? std::to_string(*mode) : "-", row[1]);
    for (const bool before : {false, true}) {
      bool after = before;
      parseBoolProperty(row[0], after);
      EXPECT_EQ(after, row[2] == "-" ? before : row[2] == "true");
    }
  });
}

TEST(TraceNames, FollowTheVendorButTheCoreDumpSuffixOnlyOnce) {
  auto& vendor = host::device().radioVendor;
  vendor = kTelephonyRadioVendorKOV;
  EXPECT_EQ(zub::trace::getCoreDumpDirSuffix(), "-coredump");
  EXPECT_EQ(zub::trace::getBasebandTraceDirSuffix(true), "-bb-trace");
  vendor = host::Profile().radioVendor;
  EXPECT_EQ(zub::trace::getCoreDumpDirSuffix(), "-coredump");
  EXPECT_EQ(zub::trace::getBasebandTraceDirSuffix(true), "-qdss");
}

TEST(Answers, HaveTheTimeOfDayToTheMillisecond) {
  using namespace std::chrono;
  setenv("TZ", "<+0545>-5:45", 1);
  tzset();
  const auto before = ceil<seconds>(system_clock::now());
  std::this_thread::sleep_until(before);  // when the milliseconds have zeros in front
  const auto text = host::timestampOr(std::nullopt);
  std::tm local{};
  const auto* const rest = strptime(text.c_str(), "%Y-%m-%d-%H-%M-%S-", &local);
  ASSERT_TRUE(rest && text.size() == 23) << text;
  const auto at =
      system_clock::from_time_t(timegm(&local)) - 5h - 45min + milliseconds(std::stoi(rest));
  EXPECT_TRUE(before <= at && at <= system_clock::now()) << text;
  unsetenv("TZ");
  tzset();
}

TEST(ZUBCommand, FlushesEachLineAndGivesAllBack) {
  const auto queueThread = dispatch::group::create();
  std::weak_ptr<zub::client::Manager> manager;
  {
    const dispatch::queue queue("tree");
    queue.async([member = dispatch::membership(queueThread)] {
      [[maybe_unused]] const thread_local dispatch::membership untilTheThreadEnds(member);
    });
    const auto own = zub::client::CreateManager("test", queue);
    manager = own;
    const auto root = ZUBCommand::create("zubtool", {}, own, queue);
    const auto logdump = root->getSubCommandObj("logdump");
    const CapturedOutput out;
    for (const std::string handler : {"tel", "core", "bb", "oslog"}) {
      EXPECT_EQ(logdump->execCommand(handler, {"600"}), handler != "oslog");
      EXPECT_TRUE(out.str().ends_with("\n$")) << handler;
    }
    EXPECT_EQ(std::ranges::count(out.str(), '\n'), std::ranges::count(out.str(), '$'));
  }
  EXPECT_TRUE(manager.expired());
  EXPECT_TRUE(queueThread.wait(std::chrono::seconds(60)));
}

}  // namespace
