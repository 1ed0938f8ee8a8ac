// The client library of the server, and what requests and replies are made of. Nothing here makes
// the device collect or reset anything.

#include <gtest/gtest.h>

#include <optional>
#include <thread>

#include "platform/lumo.h"
#include "platform/zub_client.h"

using namespace std::chrono_literals;

namespace {

class Client : public testing::Test {
 protected:
  Client() { settle(); }

  /// Waits until the queue has run what it was given.
  void settle() {
    const auto asked = dispatch::group::create();
    queue.async(
        [this, member = dispatch::membership(asked)] { thread = std::this_thread::get_id(); });
    asked.wait();
  }

  const dispatch::queue queue = dispatch::queue("contract");
  std::thread::id thread;  ///< the queue's
  const std::shared_ptr<zub::client::Manager> manager =
      zub::client::CreateManager("contract", queue);
};

/// A request that only asks: for a property of a trace.
lumo::dict propertyRequest(const char* property) {
  return {{zub::kKeyTraceName, zub::kTraceSystemLogs}, {zub::kKeyTracePropertyName, property}};
}

TEST_F(Client, CompletesOnceOnTheQueueAndReleasesTheCompletionBeforeTheNextTask) {
  for (const char* property : {zub::kKeyTraceMode, "none"}) {
    const auto answered = dispatch::group::create();
    int calls = 0;
    auto owned = std::make_shared<int>();
    const std::weak_ptr<int> completion(owned);
    auto complete = [&, owned = std::move(owned), member = dispatch::membership(answered)](
                        const auto& result, const auto& reply) {
      ++calls;
      EXPECT_EQ(std::this_thread::get_id(), thread);
      EXPECT_TRUE(result.code == 0 || !reply.isDict()) << result.message;
      queue.async([&completion, member] { EXPECT_TRUE(completion.expired()); });
    };
    zub::client::PerformCommand(manager, zub::kCommandGetTraceProperty, std::move(complete),
                                propertyRequest(property));
    ASSERT_TRUE(answered.wait(60s));
    EXPECT_EQ(calls, 1);
  }
}

TEST_F(Client, ReportsTheStateAnewOnTheQueueWhenEventsComeOn) {
  lumo::object reply;
  const auto asked = zub::client::PerformCommand(manager, zub::kCommandGetTraceProperty,
                                                 propertyRequest(zub::kKeyTraceMode), &reply);
  if (asked.code == zub::kResultServerNotRunning) GTEST_SKIP() << "there is no server";
  const auto reported = dispatch::group::create();
  const auto pending = std::make_shared<std::optional<dispatch::membership>>(reported);
  zub::client::EventsOff(manager);
  settle();
  zub::client::RegisterEventHandler(
      manager, zub::kEventServerStateChange,
      [pending, expected = thread](const lumo::object& payload, const auto&) {
        EXPECT_TRUE(!payload.isDict() || payload.get(zub::kKeyServerState).as<std::string>());
        EXPECT_EQ(std::this_thread::get_id(), expected);
        pending->reset();
      });
  settle();
  EXPECT_FALSE(reported.wait(0ns)) << "events are off";
  zub::client::EventsOn(manager);
  EXPECT_TRUE(reported.wait(60s));
}

TEST(Dictionary, KeepsTheOrderOfItsKeysAndReadsWhatIsMissingAsTheNullObject) {
  lumo::dict outer = {{"inner", "old"}, {"a", true}};
  outer.set("inner", lumo::dict{{"text", "t"}});
  ASSERT_EQ(outer.entries().size(), 2);
  EXPECT_EQ(outer.entries()[0].first, "inner");
  const lumo::object object(outer);
  EXPECT_EQ(lumo::dyn_cast_or_default(object.get("inner").get("text"), "other"), "t");
  for (const auto* const none : {&object.get("no"), &object.get("inner").get("text").get("no")}) {
    EXPECT_FALSE(none->isDict() || none->as<std::string>() || none->as<bool>() ||
                 none->as<std::int64_t>());
    EXPECT_EQ(lumo::dyn_cast_or_default(*none, "other"), "other");
  }
}

}  // namespace
