// The simulated device, its profile, and what it takes from this machine.

#include <gtest/gtest.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <map>
#include <new>
#include <thread>

#include "platform/host/device/Device.h"
#include "platform/host/device/Requests.h"
#include "platform/telephony.h"
#include "platform/zub_client.h"
#include "tests/CapturedOutput.h"
#include "tests/FailingAllocations.h"
#include "tests/Program.h"
#include "tests/Table.h"
#include "tool/ServerState.h"
#include "tool/StartUpChecks.h"
#include "tool/ZUBCommand.h"

using namespace std::chrono_literals;

namespace {

using host::Profile;

/// What is wrong with a profile, or "good".
std::string parse(std::string_view text, Profile& profile) {
  return host::parseProfile(text, "dir/p.device", profile).value_or("good");
}

TEST(Profile, TakesWhatAPersonWouldWrite) {
  Profile profile;
  const auto wrong = parse(
      "\xEF\xBB\xBF# a byte order mark and a comment, then a blank line\r\n\n"
      "radio=0x10 # another\n product = 2147483647\nradio-vendor = -2\r\n"
      "processes = modemd\t @host  x\nserver = 0 Started, 250 Shutting down ,250 Off\n"
      "system-logs-mode =\nbaseband-enabled = !0xE020E001\ndump = !-1\ndump-timestamp =\n"
      "dump-delay = 4294967295\nhelper-timestamp = a = b\nlog = logs/x\nlog-end = never",
      profile);
  EXPECT_EQ(wrong, "good");
  EXPECT_EQ(std::tuple(profile.radio, profile.product, profile.radioVendor, profile.hostProcesses),
            std::tuple(16, 2147483647, -2, true));
  EXPECT_EQ(profile.processes, (std::vector<std::string>{"modemd", "x"}));
  ASSERT_EQ(profile.server.size(), 3U);
  EXPECT_EQ(profile.server[1].state, "Shutting down");
  EXPECT_EQ(std::tuple(profile.server[2].at.count(), profile.dumpDelay.count()),
            std::tuple(250, 4294967295));
  EXPECT_EQ(std::tuple(profile.basebandEnabled.code, profile.dump.code),
            std::tuple(static_cast<std::int32_t>(0xE020E001), -1));
  EXPECT_EQ(profile.systemLogsMode.text + *profile.dumpTimestamp + *profile.helperTimestamp,
            "a = b");
  EXPECT_EQ(profile.log, "dir/logs/x");
  EXPECT_EQ(profile.logEnd, std::nullopt);
}

TEST(Profile, KnowsProductsByName) {
  std::map<std::string, int> products = {{"Unknown", 0}, {"Phone", 1},        {"PhoneLarge", 2},
                                         {"Tablet", 16}, {"TabletLarge", 17}, {"31", 31},
                                         {"46", 46}};
  for (int i = 0; i < 14; ++i) {
    products["Watch" + std::to_string(1 + i / 2) + (i % 2 == 0 ? "Small" : "Large")] = 32 + i;
  }
  for (const auto& [name, code] : products) {
    Profile profile;
    EXPECT_EQ(parse("product = " + name, profile), "good");
    EXPECT_EQ(host::device().product = profile.product, code) << name;
    EXPECT_EQ(config::hw::watch(), name.starts_with("Watch")) << name;
  }
}

TEST(Profile, RefusesWhatItDoesNotUnderstand) {
  forEachRow("profile-errors", 2, [](const Row& row) {
    Profile profile;
    EXPECT_EQ(parse(row[0], profile), "dir/p.device:" + row[1]);
  });
}

TEST(Profile, HasItsKeysInTheManual) {
  const auto manual = readFile(ZUBTOOL_SOURCES "/docs/zub-device.5");
  for (const auto key : host::profileKeys()) {
    EXPECT_NE(manual.find("\n.It Ic " + std::string(key)), std::string::npos) << key;
  }
}

TEST(Profile, ThoseThatShipAreGood) {
  for (const auto& file : std::filesystem::directory_iterator(ZUBTOOL_SOURCES "/devices")) {
    Profile profile;
    EXPECT_EQ(parse(readFile(file.path()), profile), "good") << file;
    EXPECT_EQ(profile == Profile(), file.path().stem() == "phone") << file;
  }
}

TEST(Processes, RunUntilTheyEndAndNotUntilTheyAreReaped) {
  const auto name = "x) Z (y";
  prctl(PR_SET_NAME, name);
  EXPECT_FALSE(tlu::isProcessRunning(name));
  host::device().hostProcesses = true;
  EXPECT_TRUE(tlu::isProcessRunning(name));
  const pid_t process = fork();
  if (process == 0) _exit(0);
  prctl(PR_SET_NAME, "zub_tests");
  waitid(P_PID, static_cast<id_t>(process), nullptr, WEXITED | WNOWAIT);
  EXPECT_FALSE(tlu::isProcessRunning(name));
  waitpid(process, nullptr, 0);
}

TEST(RequestLog, SaysWhyItCannotBeWritten) {
  for (const auto& [path, shown, why] :
       {std::tuple("no/e\u0301 \x1b]0;\xC2\x9B\x7F", "no/e\u0301 \\x1b]0;\\x9b\\x7f",
                   "No such file or directory"),
        {"/dev/full", "/dev/full", "No space left on device"}}) {
    host::device().requestLog = path;
    testing::internal::CaptureStderr();
    host::recordRequest("request");
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              std::string(shown) + ": cannot write the request log: " + why + "\n");
  }
}

TEST(Server, IsAskedAndTakesHandlersWhileItsStateChanges) {
  host::device().server = {{0ms, "Started"}, {20ms, "Started"}};
  host::device().dumpDelay = 40ms;
  const auto use = [] {  // shares nothing with another thread's
    const auto manager = zub::client::CreateManager("test", dispatch::queue("test"));
    zub::client::EventsOff(manager);
    for (int i = 0; i < 100; ++i) {
      zub::client::RegisterEventHandler(
          manager, zub::kEventServerStateChange,
          [](const auto&, const auto&) { ADD_FAILURE() << "events are off"; });
    }
    lumo::object reply;
    EXPECT_EQ(zub::client::PerformCommand(manager, zub::kCommandTraceDumpState, {}, &reply).code,
              0);
  };
  const std::jthread other(use);
  use();
}

TEST(Server, OutlivesEachAllocationOfACollectionThatFails) {
  const dispatch::queue queue("test");
  host::device().server = {{0ms, "a state that takes memory"}};
  const auto followed = zub::client::CreateManager("followed", queue);
  host::device().server = {{0ms, "Started"}};
  zub::client::RegisterEventHandler(
      followed, zub::kEventServerStateChange,
      [](const lumo::object& payload, const auto&) { SetServerState(payload); });
  for (const std::string handler : {"tel", "core", "bb"}) {
    bool failed = true;
    for (int nth = 1; failed; ++nth) {
      const CapturedOutput out;
      std::cout << "this takes the memory for all of the output" << std::endl;
      bool succeeded = false;
      {
        const FailingAllocation failing(nth);
        try {
          zub::client::EventsOff(followed);
          zub::client::EventsOn(followed);
          const auto manager = zub::client::CreateManager("test", queue);
          const auto root = ZUBCommand::create("zubtool", {}, manager, queue);
          succeeded = root->getSubCommandObj("logdump")->execCommand(handler, {"reason"});
        } catch (const std::bad_alloc&) {
          succeeded = false;
        }
        failed = FailingAllocation::hasFailed();
      }
      const std::string said = out.str();
      EXPECT_TRUE(!succeeded || said.find("og collection") != std::string::npos) << handler;
      EXPECT_TRUE(failed || said.find("\n$Path = ") != std::string::npos) << said;
    }
  }
}

}  // namespace
