// The simulated device, its profile, and what it takes from this machine.

#include <gtest/gtest.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <ctime>
#include <filesystem>
#include <sstream>
#include <thread>

#include "platform/host/device/Device.h"
#include "platform/host/device/Requests.h"
#include "platform/telephony.h"
#include "platform/zub_client.h"
#include "tests/Program.h"
#include "tests/Table.h"
#include "tool/StartUpChecks.h"

using namespace std::chrono_literals;
using std::chrono::system_clock;

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
  EXPECT_EQ(std::tuple(profile.radio, profile.product, profile.radioVendor, profile.hostProcesses,
                       profile.dumpDelay.count(), profile.basebandEnabled.code, profile.dump.code),
            std::tuple(16, 2147483647, -2, true, 4294967295, -0x1FDF1FFF, -1));
  EXPECT_EQ(profile.processes, (std::vector<std::string>{"modemd", "x"}));
  EXPECT_EQ(profile.server, (std::vector<host::ServerStep>{
                                {0ms, "Started"}, {250ms, "Shutting down"}, {250ms, "Off"}}));
  EXPECT_EQ(
      profile.systemLogsMode.text + *profile.dumpTimestamp + *profile.helperTimestamp + profile.log,
      "a = bdir/logs/x");
  EXPECT_EQ(profile.logEnd, std::nullopt);
}

TEST(Profile, KnowsProductsByName) {
  std::istringstream products(
      "Unknown 0 Phone 1 PhoneLarge 2 Tablet 16 TabletLarge 17 31 31 46 46 Watch1Small 32 "
      "Watch1Large 33 Watch2Small 34 Watch2Large 35 Watch3Small 36 Watch3Large 37 Watch4Small 38 "
      "Watch4Large 39 Watch5Small 40 Watch5Large 41 Watch6Small 42 Watch6Large 43 Watch7Small 44 "
      "Watch7Large 45");
  int code = 0;
  for (std::string name; products >> name >> code;) {
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
        {"/dev/full", "/dev/full", "No space left on device"},
        {"/proc/self/exe", "/proc/self/exe", "Operation not permitted"}}) {
    host::device().file = "/proc/self/exe";
    host::device().requestLog = path;
    testing::internal::CaptureStderr();
    host::recordRequest("request");
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              std::string(shown) + ": cannot write the request log: " + why + "\n");
  }
}

TEST(Answers, HaveTheTimeOfDayToTheMillisecond) {
  setenv("TZ", "<+0545>-5:45", 1);
  tzset();
  const auto secondInNepal = [] {
    const auto now = system_clock::to_time_t(system_clock::now() + 5h + 45min);
    char text[sizeof "YYYY-MM-DD-hh-mm-ss-"];
    std::strftime(text, sizeof text, "%Y-%m-%d-%H-%M-%S-", std::gmtime(&now));
    return std::string(text);
  };
  // When the milliseconds have zeros in front.
  std::this_thread::sleep_until(std::chrono::ceil<std::chrono::seconds>(system_clock::now()));
  const auto before = secondInNepal() + "000";
  const auto text = host::timestampOr(std::nullopt);
  EXPECT_EQ(text.size(), before.size()) << text;
  EXPECT_TRUE(before <= text && text <= secondInNepal() + "999") << text;
}

TEST(Server, IsAskedAndTakesHandlersWhileItsStateChanges) {
  host::device().server = {{0ms, "Started"}, {20ms, "Started"}};
  host::device().dumpDelay = 40ms;
  const auto complain = [](const auto&, const auto&) { ADD_FAILURE() << "events are off"; };
  const auto use = [&complain] {  // shares nothing with another thread's
    const auto manager = zub::client::CreateManager("test", dispatch::queue("test"));
    zub::client::EventsOff(manager);
    for (int i = 0; i < 100; ++i) {
      zub::client::RegisterEventHandler(manager, zub::kEventServerStateChange, complain);
    }
    lumo::object reply;
    zub::client::PerformCommand(manager, zub::kCommandTraceDumpState, {}, &reply);
    EXPECT_TRUE(reply.isDict());
  };
  const std::jthread other(use);
  use();
}

}  // namespace
