#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <iostream>

#include "platform/system.h"

namespace {

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

}  // namespace
