#include <fcntl.h>
#include <unistd.h>

#include <csignal>
#include <iostream>
#include <streambuf>
#include <tuple>

#include "platform/posix/Descriptor.h"
#include "platform/system.h"

namespace {

constexpr std::size_t kBufferSize = 8192;

class InputBuffer final : public std::streambuf {
 public:
  explicit InputBuffer(int source) : descriptor(source) {}

 protected:
  int_type underflow() override {
    setg(buffer, buffer, buffer + posix::readSome(descriptor, buffer, sizeof buffer));
    return gptr() == egptr() ? traits_type::eof() : traits_type::to_int_type(*gptr());
  }

 private:
  const int descriptor;
  char buffer[kBufferSize];
};

/// Drops what cannot be written, so that the stream stays good.
class OutputBuffer final : public std::streambuf {
 public:
  explicit OutputBuffer(int target) : descriptor(target) { setp(buffer, buffer + sizeof buffer); }

 protected:
  int_type overflow(int_type byte) override {
    sync();
    if (!traits_type::eq_int_type(byte, traits_type::eof())) {
      sputc(traits_type::to_char_type(byte));
    }
    return traits_type::not_eof(byte);
  }

  int sync() override {
    write({pbase(), static_cast<std::size_t>(pptr() - pbase())});
    setp(buffer, buffer + sizeof buffer);
    return 0;
  }

 private:
  void write(std::string_view bytes) {
    if (bytes.empty()) return;
    posix::beforeOutput();
    std::ignore = posix::writeAll(descriptor, bytes);
  }

  const int descriptor;
  char buffer[kBufferSize];
};

}  // namespace

void platform::openStandardStreams() {
  for (int stream = STDIN_FILENO; stream <= STDERR_FILENO; ++stream) {
    if (fcntl(stream, F_GETFD) < 0) open("/dev/null", O_RDWR);
  }
  signal(SIGPIPE, SIG_IGN);
  signal(SIGXFSZ, SIG_IGN);
  // Never destroyed: other threads outlive exit, which flushes the output.
  std::cin.rdbuf(new InputBuffer(STDIN_FILENO));
  std::cout.rdbuf(new OutputBuffer(STDOUT_FILENO));
  std::cerr.rdbuf(new OutputBuffer(STDERR_FILENO));
  std::cerr.unsetf(std::ios::unitbuf);
}
