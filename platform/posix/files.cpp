#include "platform/posix/files.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "platform/posix/Descriptor.h"
#include "platform/system.h"

namespace platform {
namespace {

class AppendedFile final : public FileHandle {
 public:
  explicit AppendedFile(posix::Descriptor opened) : descriptor(std::move(opened)) {}

  bool write(std::string_view bytes) override {
    ssize_t written = -1;
    do {
      written = ::write(descriptor.get(), bytes.data(), bytes.size());
    } while (written < 0 && errno == EINTR);
    return written >= 0 && static_cast<std::size_t>(written) == bytes.size();
  }

 private:
  posix::Descriptor descriptor;
};

}  // namespace

void createEmptyFile(const std::string& path) {
  struct stat present {};
  if (stat(path.c_str(), &present) == 0 && !S_ISREG(present.st_mode)) return;
  if (posix::isReadByDevice(path)) return;
  constexpr mode_t kForAll = 0666;  // less the process's file mode creation mask
  const posix::Descriptor made(
      open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, kForAll));
}

std::unique_ptr<FileHandle> FileHandle::openForAppending(const std::string& path) {
  if (posix::isReadByDevice(path)) return nullptr;
  // A pipe without a reader would block an open for writing, without end: O_NONBLOCK refuses it.
  posix::Descriptor opened(open(path.c_str(), O_WRONLY | O_APPEND | O_NONBLOCK | O_CLOEXEC));
  if (!opened) return nullptr;
  fcntl(opened.get(), F_SETFL, O_APPEND);  // the writes themselves may block
  return std::make_unique<AppendedFile>(std::move(opened));
}

}  // namespace platform
