#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

#include "logdump/TraceProperty.h"
#include "platform/host/device/Device.h"
#include "tests/CapturedOutput.h"
#include "tests/FailingAllocations.h"
#include "tests/Table.h"
#include "tool/ServerState.h"
#include "tool/ZUBCommand.h"

namespace {

TEST(TraceProperty, ReadsWordsAndNumbers) {
  forEachRow("trace-property", 3, [](const Row& row) {
    std::istringstream texts(row[0]);
    for (std::string text; std::getline(texts, text, ',');) {
      const auto mode = ParseTraceMode(text);
      EXPECT_EQ(mode ? std::to_string(*mode) : "-", row[1]) << text;
      for (const bool before : {false, true}) {
        bool after = before;
        parseBoolProperty(text, after);
        EXPECT_EQ(after, row[2] == "-" ? before : row[2] == "true") << text;
      }
    }
  });
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

TEST(ZUBCommand, OutlivesEachAllocationOfACollectionThatFails) {
  const dispatch::queue queue("test");
  host::device().server[0].state = "a state that takes memory";
  const auto followed = zub::client::CreateManager("followed", queue);
  host::device() = {};
  zub::client::RegisterEventHandler(
      followed, zub::kEventServerStateChange,
      [](const lumo::object& payload, const auto&) { SetServerState(payload); });
  for (const std::string handler : {"tel", "core", "bb"}) {
    bool failed = true;
    for (int nth = 1; failed; ++nth) {
      const CapturedOutput out;
      std::cout << "this takes the memory for all of the output" << std::endl;
      bool succeeded = false;
      failed = failAllocation(nth, [&] {
        zub::client::EventsOff(followed);
        zub::client::EventsOn(followed);
        const auto manager = zub::client::CreateManager("test", queue);
        const auto root = ZUBCommand::create("zubtool", {}, manager, queue);
        succeeded = root->getSubCommandObj("logdump")->execCommand(handler, {"reason"});
      });
      EXPECT_TRUE(!succeeded || out.str().find("og collection") != std::string::npos) << handler;
      EXPECT_TRUE(failed || out.str().find("\n$Path = ") != std::string::npos) << out.str();
    }
  }
}

}  // namespace
