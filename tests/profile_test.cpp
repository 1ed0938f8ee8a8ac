#include "platform/host/device/Profile.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <sstream>

#include "tests/Program.h"
#include "tests/Table.h"

namespace {

using host::Profile;

std::optional<std::string> parse(std::string_view text, Profile& profile) {
  return host::parseProfile(text, "dir/p.device", profile);
}

TEST(Profile, TakesWhatAPersonWouldWrite) {
  Profile profile;
  const auto wrong = parse(
      "\xEF\xBB\xBF# a byte order mark and a comment, then a blank line\r\n\n"
      "radio=0x10 # another\n product = Watch3Large\nradio-vendor = -2\r\n"
      "processes = modemd\t @host  x\nserver = 0 Started, 250 Shutting down ,250 Off\n"
      "system-logs-mode =\nbaseband-enabled = !0xE020E001\ndump = !-1\ndump-timestamp =\n"
      "dump-delay = 4294967295\nhelper-timestamp = a = b\nlog = logs/x\nlog-end = never",
      profile);
  EXPECT_EQ(wrong.value_or("good"), "good");
  EXPECT_EQ(profile.radio, 16);
  EXPECT_EQ(profile.product, static_cast<int>(TelephonyProduct::Watch3Large));
  EXPECT_EQ(profile.radioVendor, -2);
  EXPECT_EQ(profile.processes, (std::vector<std::string>{"modemd", "x"}));
  EXPECT_TRUE(profile.hostProcesses);
  ASSERT_EQ(profile.server.size(), 3U);
  EXPECT_EQ(profile.server[1].state, "Shutting down");
  EXPECT_EQ(profile.server[2].at.count(), 250);
  EXPECT_EQ(profile.systemLogsMode.text, "");
  EXPECT_EQ(profile.basebandEnabled.code, static_cast<std::int32_t>(0xE020E001));
  EXPECT_EQ(profile.dump.code, -1);
  EXPECT_EQ(profile.dumpTimestamp, "");
  EXPECT_EQ(profile.dumpDelay.count(), 4294967295);
  EXPECT_EQ(profile.helperTimestamp, "a = b");
  EXPECT_EQ(profile.log, "dir/logs/x");
  EXPECT_EQ(profile.logEnd, std::nullopt);
}

TEST(Profile, RefusesWhatItDoesNotUnderstand) {
  forEachRow("profile-errors", 2, [](const Row& row) {
    Profile profile;
    EXPECT_EQ(parse(row[0], profile).value_or("good"), "dir/p.device:" + row[1]);
  });
}

TEST(Profile, ThoseThatShipAreGood) {
  for (const auto& file : std::filesystem::directory_iterator(ZUBTOOL_SOURCES "/devices")) {
    Profile profile;
    EXPECT_EQ(parse(readFile(file.path()), profile).value_or("good"), "good") << file;
    EXPECT_EQ(profile == Profile(), file.path().stem() == "phone") << file;
  }
}

TEST(Profile, ItsManualAndItsExampleShowEachKey) {
  const auto manual = readFile(ZUBTOOL_SOURCES "/docs/zub-device.5");
  std::istringstream example(readFile(ZUBTOOL_SOURCES "/devices/phone.device"));
  std::size_t settings = 1;  // and request-log, which has no default
  for (std::string line; std::getline(example, line);) {
    line = line.substr(0, line.find('#'));
    line.resize(line.find_last_not_of(' ') + 1);
    if (line.empty()) continue;
    ++settings;
    const auto item = "\n.It Ic " + line.replace(line.find(" ="), 2, " No =") + '\n';
    EXPECT_NE(manual.find(item), std::string::npos) << item;
  }
  EXPECT_EQ(settings, host::profileKeys().size());
  EXPECT_NE(manual.find("\n.It Ic request-log\n"), std::string::npos);
  for (auto at = manual.find("\n.It Ic "); at != std::string::npos; --settings) {
    at = manual.find("\n.It Ic ", at + 1);
  }
  EXPECT_EQ(settings, 0) << "the manual has other keys as well";
}

}  // namespace
