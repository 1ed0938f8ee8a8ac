// The real program where a case of tests/cases cannot say what is to be seen.

#include <gtest/gtest.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>

#include "tests/Program.h"

namespace {

const std::string kPrompt = "(/zubtool)>> ";

TEST(Program, FollowsTheServerWhileItPrompts) {
  Program program({.profile = "server = 2000 Started\ndump-timestamp = T"});
  EXPECT_EQ(program.readUntil(kPrompt), kPrompt);
  int refused = -1;
  do {
    ++refused;
    program.type("logdump core\n");
  } while (program.readUntil(kPrompt) == kPrompt);
  const auto outcome = program.finish();
  EXPECT_GT(refused, 0);
  EXPECT_EQ(std::ranges::count(outcome.err, '\n'), refused);
  EXPECT_EQ(std::ranges::count(outcome.requests, '\n'), 1);
}

TEST(Program, LosesNothingToASlowReader) {
  constexpr int kLines = 2000;  // of help, far more than a pipe holds
  std::string lines;
  for (int i = 0; i < kLines; ++i) lines += "help\n";
  Program program({});
  EXPECT_EQ(program.readUntil(kPrompt), kPrompt);
  program.type(lines + "quit\n");
  const auto outcome = program.finish();  // which reads a byte at a time
  EXPECT_EQ(outcome.status, 0);
  EXPECT_EQ(outcome.out.size(), kLines * (run({{"help"}}).out.size() + kPrompt.size()));
}

TEST(Program, ExportsTheLogOfARealMachine) {
  const ScratchFolder folder;
  const std::string data = ZUBTOOL_SOURCES "/tests/data/machine.";
  const Start start = {{"logdump", "oslog", "2147483647", folder.path("out"), "-p",
                        "systemd-journald", "-i", "LOGGER", "python"},
                       "log = " + data + "export"};
  expectOutcome(run(start), {});
  EXPECT_EQ(readFile(folder.path("out")), readFile(data + "txt"));
  expectOutcome(run({{"logdump", "oslog", "600", folder.path("out")}}), {});
  EXPECT_EQ(std::ranges::count(readFile(folder.path("out")), '\n'), 6) << "of the sample";
  const auto own = folder.path("own");
  writeFile(own, readFile(data + "export"));
  expectOutcome(run({{"logdump", "oslog", "600", own}, "log = " + own}), {.status = 1});
  EXPECT_EQ(readFile(own), readFile(data + "export")) << "the log is no place to export it to";
}

/// Whether this process got a /dev of its own, with nothing in it.
bool hideDevices() {
  const bool isRoot = geteuid() == 0;
  const auto user = std::to_string(geteuid());
  const auto group = std::to_string(getegid());
  if (unshare(isRoot ? CLONE_NEWNS : CLONE_NEWNS | CLONE_NEWUSER) != 0) return false;
  if (!isRoot) {
    writeFile("/proc/self/uid_map", user + " " + user + " 1");
    writeFile("/proc/self/setgroups", "deny");
    writeFile("/proc/self/gid_map", group + " " + group + " 1");
  }
  return mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
         mount("none", "/dev", "tmpfs", 0, nullptr) == 0;
}

TEST(Program, ReportsErrorsToTheSystemLogUnderItsName) {
  const pid_t child = fork();
  if (child == 0) {
    if (!hideDevices()) _exit(77);
    const int log = socket(AF_UNIX, SOCK_DGRAM, 0);
    const sockaddr_un address = {AF_UNIX, "/dev/log"};
    EXPECT_EQ(bind(log, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    const std::string line("logdump oslog 600 no\0/such\nquit\n", 33);
    expectOutcome(run({.input = line, .name = "./a/name"}), {.out = "(/name)>> (/name)>> "});
    char text[100] = {};
    recv(log, text, sizeof text, MSG_DONTWAIT);
    EXPECT_TRUE(std::string_view(text).starts_with("<11>")) << text;  // the level of an error
    EXPECT_STREQ(text + std::strlen("<11>Jan  1 00:00:00 "),
                 "name: Failed to create file: no?/such");
    _exit(testing::Test::HasFailure() ? 1 : 0);
  }
  int status = 0;
  waitpid(child, &status, 0);
  if (WEXITSTATUS(status) == 77) GTEST_SKIP() << "no mount namespace may be had";
  EXPECT_EQ(status, 0);
}

TEST(Program, EndsWhenTheShellThreadCannotStart) {
  rlimit before{};
  ASSERT_EQ(getrlimit(RLIMIT_STACK, &before), 0);
  const rlim_t size = sizeof(void*) == 8 ? rlim_t{1} << 46 : 0xF0000000;  // of a thread's stack
  const rlimit huge = {size, before.rlim_max};
  if (setrlimit(RLIMIT_STACK, &huge) != 0) GTEST_SKIP() << "the stack's limit is fixed";
  const auto outcome = run({{"help"}});
  setrlimit(RLIMIT_STACK, &before);
  if (outcome.err.starts_with("FATAL: ThreadSanitizer")) GTEST_SKIP() << "it needs its own layout";
  expectOutcome(
      outcome,
      {.err = "Cannot start the shell thread: Resource temporarily unavailable\n", .status = 255});
}

TEST(Program, ExitsWhileTheQueueStillWorks) {
  std::string steps = "server = 0 Started";
  for (int i = 0; i < 4000; ++i) steps += ", " + std::to_string(400 + i / 20) + " Started";
  std::vector<Program> programs;
  for (int i = 0; i < 8; ++i) programs.emplace_back(Start{{"--"}, steps});
  for (auto& program : programs) expectOutcome(program.finish(), {});
}

}  // namespace
