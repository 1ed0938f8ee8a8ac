#include "platform/system.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <fstream>
#include <iostream>
#include <thread>

#include "platform/telephony.h"
#include "tests/Program.h"

using namespace std::chrono_literals;

namespace {

TEST(Files, AreEmptiedThenAppendedToAndOfOtherKindsLeftAsTheyAre) {
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
  ASSERT_EQ(mkfifo(folder.path("pipe").c_str(), 0600), 0);
  EXPECT_EQ(platform::FileHandle::createEmpty(folder.path("pipe")), nullptr) << "nobody reads it";
  EXPECT_EQ(platform::FileHandle::createEmpty(folder.path("")), nullptr) << "a folder";
  const auto full = platform::FileHandle::createEmpty("/dev/full");
  EXPECT_TRUE(!full || full->write("bytes") == std::errc::no_space_on_device);
  for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    const int before = dup(stream);
    dup2(open(path.c_str(), O_RDONLY | O_CLOEXEC), stream);
    EXPECT_EQ(platform::FileHandle::createEmpty(path), nullptr) << stream;
    dup2(before, stream);
  }
  EXPECT_NE(readFile(path), "");
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

TEST(StandardStreams, GoOnAfterAFailureWriteEachLineAtOnceAndDropNoByte) {
  platform::openStandardStreams();
  int ends[2];  // of a pipe from which a read takes what one write has written
  ASSERT_EQ(pipe2(ends, O_CLOEXEC | O_DIRECT | O_NONBLOCK), 0);
  const auto take = [&ends] {
    char text[8192];
    return std::string(
        text, static_cast<std::size_t>(std::max(read(ends[0], text, sizeof text), ssize_t{0})));
  };
  const int full = open("/dev/full", O_WRONLY | O_CLOEXEC);
  for (auto [stream, number] :
       {std::pair(&std::cout, STDOUT_FILENO), {&std::cerr, STDERR_FILENO}}) {
    const int before = dup(number);
    dup2(full, number);
    *stream << "lost" << std::endl;
    dup2(ends[1], number);
    *stream << "line " << 1 << std::endl;
    const auto line = take();
    std::size_t written = 10'000;  // more than a buffer holds
    *stream << std::string(written, 'x') << std::flush;
    dup2(before, number);
    EXPECT_EQ(line, "line 1\n");
    for (auto piece = take(); !piece.empty(); piece = take()) written -= piece.size();
    EXPECT_EQ(written, 0U);
  }
}

TEST(StandardStreams, WaitThroughSignals) {
  constexpr std::size_t kSize = 1 << 20;  // more than a socket holds
  struct sigaction interrupt = {};
  interrupt.sa_handler = [](int) {};
  sigaction(SIGALRM, &interrupt, nullptr);
  platform::openStandardStreams();
  for (const int flags : {0, O_NONBLOCK}) {
    int ends[2];
    ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    fcntl(ends[0], F_SETFL, flags);
    const int before = dup(STDOUT_FILENO);
    dup2(ends[0], STDOUT_FILENO);
    close(ends[0]);
    std::size_t received = 0;
    std::thread reader([&received, end = ends[1]] {
      char piece[65536];
      for (ssize_t size = 0; (size = read(end, piece, sizeof piece)) > 0;) {
        received += static_cast<std::size_t>(size);
        std::this_thread::sleep_for(5ms);  // in which the stream can write nothing
      }
    });
    ualarm(1000, 1000);
    std::cout << std::string(kSize, 'x') << std::flush;
    ualarm(0, 0);
    dup2(before, STDOUT_FILENO);
    reader.join();
    EXPECT_EQ(received, kSize);
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
