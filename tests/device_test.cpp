// The simulated device, and what it takes from this machine.

#include <gtest/gtest.h>
#include <pthread.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

#include "platform/host/device/Device.h"
#include "platform/host/device/RequestLog.h"
#include "platform/telephony.h"
#include "platform/zub_client.h"
#include "tests/Program.h"

namespace {

TEST(Processes, RunUntilTheyEndAndNotUntilTheyAreReaped) {
  EXPECT_FALSE(tlu::isProcessRunning("zub_tests"));
  host::device().hostProcesses = true;
  EXPECT_TRUE(tlu::isProcessRunning("zub_tests"));
  const auto name = "x) Z (y";
  const pid_t process = fork();
  if (process == 0) {
    prctl(PR_SET_NAME, name);
    raise(SIGSTOP);
    _exit(0);
  }
  waitpid(process, nullptr, WUNTRACED);
  EXPECT_TRUE(tlu::isProcessRunning(name));
  kill(process, SIGCONT);
  waitid(P_PID, static_cast<id_t>(process), nullptr, WEXITED | WNOWAIT);
  EXPECT_FALSE(tlu::isProcessRunning(name));
  waitpid(process, nullptr, 0);
}

TEST(RequestLog, SaysWhyItCannotBeWritten) {
  const ScratchFolder folder;
  const auto unreadPipe = folder.path("pipe");
  ASSERT_EQ(mkfifo(unreadPipe.c_str(), 0600), 0);
  for (const auto& [path, why] : {std::pair(unreadPipe, "No such device or address"),
                                  {std::string("/dev/full"), "No space left on device"}}) {
    host::device().requestLog = path;
    testing::internal::CaptureStderr();
    host::recordRequest("request");
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              path + ": cannot write the request log: " + why + "\n");
  }
}

TEST(Server, FailsADumpForWhichThereIsNoThread) {
  host::device().dumpDelay = std::chrono::hours(1);
  const auto manager = zub::client::CreateManager("test", dispatch::queue("test"));
  const auto group = dispatch::group::create();
  std::int32_t code = 0;
  zub::client::Completion completion = [&code, member = dispatch::membership(group)](
                                           const TelephonyLumo::Result& result,
                                           const lumo::object&) { code = result.code; };
  pthread_attr_t before{};
  pthread_getattr_default_np(&before);
  pthread_attr_t huge{};
  pthread_attr_init(&huge);
  pthread_attr_setstacksize(&huge, std::size_t{1} << 46);
  ASSERT_EQ(pthread_setattr_default_np(&huge), 0);
  zub::client::PerformCommand(manager, zub::kCommandTraceDumpState, std::move(completion), {});
  pthread_setattr_default_np(&before);
  EXPECT_TRUE(group.wait(std::chrono::seconds(60)));
  EXPECT_NE(code, 0);
}

}  // namespace
