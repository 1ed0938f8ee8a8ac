#include <fcntl.h>
#include <unistd.h>

#include <csignal>
#include <iostream>
#include <streambuf>

#include "platform/posix/Descriptor.h"
#include "platform/system.h"

namespace {

/// Reads from a descriptor or writes to it, but not both. Output that cannot be written is dropped,
/// so that the stream stays good.
class DescriptorBuffer final : public std::streambuf {
 public:
  explicit DescriptorBuffer(int opened) : descriptor(opened) {
    setp(buffer, buffer + sizeof buffer);
  }

 protected:
  int_type underflow() override {
    setg(buffer, buffer, buffer + posix::readSome(descriptor, buffer, sizeof buffer));
    return gptr() == egptr() ? traits_type::eof() : traits_type::to_int_type(*gptr());
  }

  /// Called by the public functions of the base alone, which have a byte that does not fit.
  int_type overflow(int_type byte) override {
    sync();
    return sputc(traits_type::to_char_type(byte));
  }

  int sync() override {
    if (pptr() == pbase()) return 0;
    posix::beforeOutput();
    static_cast<void>(posix::writeAll(descriptor, {pbase(), pptr()}));
    setp(buffer, buffer + sizeof buffer);
    return 0;
  }

 private:
  const int descriptor;
  char buffer[8192];
};

}  // namespace

void platform::openStandardStreams() {
  for (int stream = STDIN_FILENO; stream <= STDERR_FILENO; ++stream) {
    if (fcntl(stream, F_GETFD) < 0) open("/dev/null", O_RDWR);
  }
  signal(SIGPIPE, SIG_IGN);
  signal(SIGXFSZ, SIG_IGN);
  // Never destroyed: other threads outlive exit, which flushes the output.
  std::cin.rdbuf(new DescriptorBuffer(STDIN_FILENO));
  std::cout.rdbuf(new DescriptorBuffer(STDOUT_FILENO));
  std::cerr.rdbuf(new DescriptorBuffer(STDERR_FILENO));
  std::cerr.unsetf(std::ios::unitbuf);
}
