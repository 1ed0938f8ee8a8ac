#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>

#include "platform/posix/Descriptor.h"
#include "platform/system.h"

namespace platform {
namespace {

std::atomic<std::size_t> gLinesWritten = 0;

class AppendedFile final : public FileHandle {
 public:
  explicit AppendedFile(posix::Descriptor opened) : descriptor(std::move(opened)) {}

  std::error_code write(std::string_view bytes) override {
    gLinesWritten.fetch_add(1, std::memory_order_relaxed);
    return posix::writeAll(descriptor.get(), bytes);
  }

 private:
  posix::Descriptor descriptor;
};

/// Whether it is the file of a standard stream: commands are read there, or results are written.
bool isOfStandardStream(const struct stat& file) {
  constexpr std::array kStreams = {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO};
  return std::ranges::any_of(kStreams, [&file](int stream) {
    struct stat other = {};
    return fstat(stream, &other) == 0 && other.st_dev == file.st_dev && other.st_ino == file.st_ino;
  });
}

/// Truncates the file, unless it is a device or a pipe. Uses the descriptor that is then written:
/// by now the path may lead to another file.
bool empty(const posix::Descriptor& opened) {
  struct stat about = {};
  if (fstat(opened.get(), &about) != 0) return false;
  if (!S_ISREG(about.st_mode)) return true;
  return !isOfStandardStream(about) && ftruncate(opened.get(), 0) == 0;
}

}  // namespace

std::unique_ptr<FileHandle> FileHandle::createEmpty(const std::string& path) {
  constexpr mode_t kForItsOwner = 0600;
  auto opened = posix::openForAppending(path, kForItsOwner);
  if (!opened || !empty(opened)) return nullptr;
  if (isatty(opened.get()) != 0) posix::beforeOutput();
  return std::make_unique<AppendedFile>(std::move(opened));
}

}  // namespace platform

std::size_t posix::linesWritten() {
  return platform::gLinesWritten.load(std::memory_order_relaxed);
}
