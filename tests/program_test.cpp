// The real program where a case of tests/cases cannot say what is to be seen.

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <cstring>

#include "tests/Program.h"

namespace {

const std::string kPrompt = "(/zubtool)>> ";

TEST(Program, TakesSignalsOnOneThreadAndFollowsTheServerWhileItPrompts) {
  Program program({.profile = "server = 2000 Started, 60000 Stopped"});  // on a thread of its own
  EXPECT_EQ(program.readUntil(kPrompt), kPrompt);
  std::vector<bool> blocks;
  const auto tasks = "/proc/" + std::to_string(program.pid()) + "/task";
  for (const auto& task : std::filesystem::directory_iterator(tasks)) {
    const auto status = readFile(task.path() / "status");
    const auto mask = std::stoull(status.substr(status.find("SigBlk:") + 7), nullptr, 16);
    blocks.push_back((mask & 1ULL << (SIGTERM - 1)) != 0);
  }
  EXPECT_GE(blocks.size(), 4U);
  EXPECT_EQ(std::ranges::count(blocks, false), 1);
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

TEST(Program, ExportsTheLogOfARealMachine) {
  const ScratchFolder folder;
  const std::string data = ZUBTOOL_SOURCES "/tests/data/machine.";
  expectOutcome(run({{"logdump", "oslog", "2147483647", folder.path("out"), "-p",
                      "systemd-journald", "-i", "LOGGER", "python"},
                     "log = " + data + "export"}),
                {});
  EXPECT_EQ(readFile(folder.path("out")), readFile(data + "txt"));
  expectOutcome(run({{"logdump", "oslog", "600", folder.path("out")}}), {});
  EXPECT_EQ(std::ranges::count(readFile(folder.path("out")), '\n'), 6) << "of the sample";
}

TEST(Program, ReportsErrorsToTheSystemLog) {
  const std::string hideDevices = "unshare -rm sh -c 'mount -t tmpfs none /dev && ";
  if (system((hideDevices + "true'").c_str()) != 0) GTEST_SKIP() << "no mount namespace to be had";
  const ScratchFolder folder;
  sockaddr_un address = {AF_UNIX, ""};
  folder.path("log").copy(address.sun_path, sizeof address.sun_path - 1);
  const int log = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  ASSERT_EQ(bind(log, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
  run({.input = std::string("logdump oslog 600 no\0/such\nquit\n", 32),
       .shell = hideDevices + "ln -s " + folder.path("log") + " /dev/log && \"$@\"' sh \"$@\""});
  char text[100] = {};
  recv(log, text, sizeof text - 1, MSG_DONTWAIT);
  close(log);
  EXPECT_TRUE(std::string_view(text).starts_with("<11>")) << text;  // the level of an error
  EXPECT_STREQ(text + std::strlen("<11>Jan  1 00:00:00 "),
               "zubtool: Failed to create file: no?/such");
}

TEST(Program, ExitsWhileTheQueueStillWorks) {
  std::string steps = "server = 0 Started";
  for (int i = 0; i < 4000; ++i) steps += ", " + std::to_string(400 + i / 20) + " Started";
  std::vector<Program> programs;
  for (int i = 0; i < 8; ++i) programs.emplace_back(Start{{"--"}, steps});
  for (auto& program : programs) expectOutcome(program.finish(), {});
}

}  // namespace
