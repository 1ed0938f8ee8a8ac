#include "platform/system.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fstream>
#include <iostream>

#include "platform/telephony.h"
#include "tests/Program.h"

namespace {

TEST(System, TheProgramsNameHasNoFolder) {
  EXPECT_EQ(std::string_view(getprogname()), "zub_contract_tests");
}

TEST(Files, AreEmptiedThenAppendedTo) {
  const ScratchFolder folder;
  const auto path = folder.path("file");
  for (int round = 0; round < 2; ++round) {
    const auto file = platform::FileHandle::createEmpty(path);
    ASSERT_TRUE(file);
    EXPECT_EQ(readFile(path), "");
    EXPECT_FALSE(file->write("one,"));
    std::ofstream(path, std::ios::app) << "two,";
    EXPECT_FALSE(file->write(std::string("\0three", 6)));
    EXPECT_EQ(readFile(path), std::string("one,two,\0three", 14));
  }
}

TEST(Files, OfOtherKindsAreLeftAsTheyAre) {
  const ScratchFolder folder;
  const auto pipe = folder.path("pipe");
  ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
  EXPECT_EQ(platform::FileHandle::createEmpty(pipe), nullptr) << "nobody reads it";
  EXPECT_EQ(platform::FileHandle::createEmpty(folder.path("")), nullptr) << "a folder";
  const auto full = platform::FileHandle::createEmpty("/dev/full");
  if (!full) GTEST_SKIP() << "no /dev/full";
  EXPECT_EQ(full->write("bytes"), std::errc::no_space_on_device);
}

TEST(StandardStreams, AreOpenIfTheyWereClosed) {
  const auto open = [] {
    close(STDIN_FILENO);
    close(STDERR_FILENO);
    platform::openStandardStreams();
    _exit(fcntl(STDIN_FILENO, F_GETFD) + fcntl(STDERR_FILENO, F_GETFD));
  };
  EXPECT_EXIT(open(), testing::ExitedWithCode(0), "");
}

TEST(StandardStreams, GoOnAfterAFailureAndWriteEachLineAtOnce) {
  platform::openStandardStreams();
  int ends[2];  // of a pipe from which a read takes what one write has written
  ASSERT_EQ(pipe2(ends, O_CLOEXEC | O_DIRECT | O_NONBLOCK), 0);
  const int full = open("/dev/full", O_WRONLY | O_CLOEXEC);
  for (auto [stream, number] :
       {std::pair(&std::cout, STDOUT_FILENO), {&std::cerr, STDERR_FILENO}}) {
    const int before = dup(number);
    dup2(full, number);
    *stream << "lost" << std::endl;
    dup2(ends[1], number);
    *stream << "line " << 1 << std::endl;
    dup2(before, number);
    char text[64] = {};
    EXPECT_GT(read(ends[0], text, sizeof text - 1), 0);
    EXPECT_STREQ(text, "line 1\n");
  }
}

TEST(Text, IsComparedWithoutTheCaseOfAsciiLetters) {
  EXPECT_TRUE(util::equal_nocase("AZaz09", "azAZ09"));
  for (const auto& [left, right] :
       {std::pair("tar", "tar.gz"), {"tar", "ta"}, {"@[`{", "`{@["}, {"\xc3\x84", "\xc3\xa4"}}) {
    EXPECT_FALSE(util::equal_nocase(left, right)) << left;
  }
}

}  // namespace
