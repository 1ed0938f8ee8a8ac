#include "platform/dispatch.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <csignal>
#include <optional>
#include <thread>
#include <vector>

using namespace std::chrono_literals;

namespace {

TEST(Group, IsOpenAsLongAsAnyMembershipLives) {
  const auto group = dispatch::group::create();
  std::optional<dispatch::membership> first(group);
  std::optional<dispatch::membership> copy(first);
  std::optional<dispatch::membership> moved(std::move(first));
  EXPECT_FALSE(group.wait(0ns));
  first.reset();  // NOLINT(bugprone-use-after-move): one that was moved from gives nothing back
  copy.reset();
  EXPECT_FALSE(group.wait(0ns));
  moved.reset();
  EXPECT_TRUE(group.wait(0ns));
  EXPECT_DEATH(group.leave(), "");
  const dispatch::membership ofNone((dispatch::group()));
  dispatch::queue().async([] { FAIL() << "there is no queue"; });
}

TEST(Group, WaitEndsWithTheLastLeaveOnAnotherThread) {
  for (int round = 0; round < 2000; ++round) {
    const auto group = dispatch::group::create();
    std::atomic<int> ended = 0;
    const std::jthread one([&ended, member = dispatch::membership(group)] { ++ended; });
    const std::jthread other([&ended, member = dispatch::membership(group)] { ++ended; });
    EXPECT_TRUE(group.wait(std::chrono::nanoseconds::max()));
    EXPECT_EQ(ended, 2);
  }
}

TEST(Queue, RunsTasksInOrderAndReleasesEachBeforeTheNext) {
  const auto group = dispatch::group::create();
  const auto owned = std::make_shared<int>(0);
  std::vector<int> order;
  char label[64] = {};
  {
    const dispatch::queue queue("a label of any length");
    for (int i = 0; i < 1000; ++i) {
      queue.async([&order, i, owned, member = dispatch::membership(group)] { order.push_back(i); });
    }
    std::shared_ptr<void> last(nullptr, [queue, member = dispatch::membership(group)](void*) {
      queue.async([member] {});  // from the release of a task
    });
    queue.async([moved = std::move(last)] {});
    queue.async([&, member = dispatch::membership(group)] {
      EXPECT_EQ(owned.use_count(), 1);  // no task that has run is still held
      sigset_t blocked;
      pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
      EXPECT_EQ(sigismember(&blocked, SIGTERM), 1);
      pthread_getname_np(pthread_self(), label, sizeof label);
    });
  }  // tasks given before the last reference goes still run
  EXPECT_TRUE(group.wait(60s));
  EXPECT_TRUE(std::string_view(label).starts_with("a label")) << label;
  ASSERT_EQ(order.size(), 1000U);
  EXPECT_TRUE(std::ranges::is_sorted(order));
}

}  // namespace
