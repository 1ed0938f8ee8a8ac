#include "platform/host/Profile.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "tests/Program.h"

namespace {

using host::Answer;
using host::Profile;

std::optional<std::string> parse(std::string_view text, Profile& profile) {
  return host::parseProfile(text, "dir/p.device", profile);
}

TEST(Profile, SetsEachKey) {
  Profile profile;
  const auto wrong = parse(
      "# a comment, then a blank line\r\n\n"
      "radio=0x10 # another\n product = Watch3Large\nradio-vendor = -2\nqdss = no\n"
      "build = carrier\ncompression = tar\ncompression-supported = no\n"
      "processes = modemd\t @host  x\nserver = 0 Started, 250 Shutting down ,250 Off\n"
      "system-logs-mode =\nbaseband-enabled = !0xE020E001\nbaseband-high-throughput = !null\n"
      "dump = !-1\ndump-timestamp =\ndump-delay = 4294967295\nhelper = !empty\n"
      "helper-timestamp = a = b\nlog = logs/x\nlog-prepare = no such store\nlog-end = never",
      profile);
  EXPECT_EQ(wrong.value_or("good"), "good");
  EXPECT_EQ(profile.radio, 16);
  EXPECT_EQ(profile.product, static_cast<int>(TelephonyProduct::Watch3Large));
  EXPECT_EQ(profile.radioVendor, -2);
  EXPECT_FALSE(profile.qdss);
  EXPECT_EQ(profile.build, host::Build::carrier);
  EXPECT_EQ(profile.compression, 2);
  EXPECT_FALSE(profile.compressionSupported);
  EXPECT_EQ(profile.processes, (std::vector<std::string>{"modemd", "x"}));
  EXPECT_TRUE(profile.hostProcesses);
  ASSERT_EQ(profile.server.size(), 3U);
  EXPECT_EQ(profile.server[1].state, "Shutting down");
  EXPECT_EQ(profile.server[2].at.count(), 250);
  EXPECT_EQ(profile.systemLogsMode.text, "");
  EXPECT_EQ(profile.basebandEnabled.code, static_cast<std::int32_t>(0xE020E001));
  EXPECT_EQ(profile.basebandHighThroughput.kind, Answer::Kind::nullReply);
  EXPECT_EQ(profile.dump.code, -1);
  EXPECT_EQ(profile.dumpTimestamp, "");
  EXPECT_EQ(profile.dumpDelay.count(), 4294967295);
  EXPECT_EQ(profile.helper.kind, Answer::Kind::emptyReply);
  EXPECT_EQ(profile.helperTimestamp, "a = b");
  EXPECT_EQ(profile.log, "dir/logs/x");
  EXPECT_EQ(profile.logPrepareError, "no such store");
  EXPECT_EQ(profile.logEnd, std::nullopt);
}

TEST(Profile, RefusesWhatItDoesNotUnderstand) {
  const std::pair<std::string_view, std::string_view> cases[] = {
      {"\n\nraido = 1", "dir/p.device:3: unknown key 'raido'"},
      {"radio", "dir/p.device:1: neither 'key = value' nor a comment: 'radio'"},
      {"radio =", "dir/p.device:1: 'radio' takes a whole number, not ''"},
      {"radio = 1x", "dir/p.device:1: 'radio' takes a whole number, not '1x'"},
      {"radio = 2147483648", "dir/p.device:1: 'radio' takes a whole number, not '2147483648'"},
      {"radio = 1\nqdss = no\nradio = 2", "dir/p.device:3: 'radio' is set on line 1 already"},
      {"qdss = Yes", "dir/p.device:1: 'qdss' takes yes or no, not 'Yes'"},
      {"log = \xff", "dir/p.device:1: not UTF-8 text"},
      {"product = watch",
       "dir/p.device:1: 'product' takes a whole number or a product's name, "
       "not 'watch'"},
      {"dump = !0", "dir/p.device:1: 'dump' takes ok, !CODE (not 0), !null or !empty, not '!0'"},
      {"dump = !4294967296",
       "dir/p.device:1: 'dump' takes ok, !CODE (not 0), !null or !empty, not '!4294967296'"},
      {"dump-delay = -1", "dir/p.device:1: 'dump-delay' takes milliseconds, not '-1'"},
  };
  for (const auto& [text, wrong] : cases) {
    Profile profile;
    EXPECT_EQ(parse(text, profile).value_or("good"), wrong);
  }
  for (const auto* const steps : {"5", "x Started", "0 Started,", "9 A, 8 B", ", 0 A", "0  "}) {
    Profile profile;
    EXPECT_TRUE(parse(std::string("server = ") + steps, profile)) << steps;
  }
}

TEST(Profile, ThoseThatShipAreGood) {
  int count = 0;
  for (const auto& file : std::filesystem::directory_iterator(ZUBTOOL_SOURCES "/devices")) {
    Profile profile;
    EXPECT_EQ(parse(readFile(file.path()), profile).value_or("good"), "good") << file;
    ++count;
  }
  EXPECT_GT(count, 10);
}

}  // namespace
