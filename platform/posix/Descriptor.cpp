#include "platform/posix/Descriptor.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <cerrno>

namespace posix {
namespace {

/// Whether to repeat a call that failed with `error`. Waits until `descriptor` is ready for
/// `event`.
bool isWorthRepeating(int error, int descriptor, short event) {
  if (error == EINTR) return true;
  if (error != EAGAIN) return false;
  pollfd ready = {descriptor, event, 0};
  return ::poll(&ready, 1, -1) > 0 || errno == EINTR;
}

}  // namespace

Descriptor openForAppending(const std::string& path, mode_t mode) {
  if (path.find('\0') != std::string::npos) {  // the system would open another file
    errno = EINVAL;
    return Descriptor();
  }
  if (isReadByDevice(path)) {
    errno = EPERM;
    return Descriptor();
  }
  // Always with O_CREAT: the kernel then refuses another user's file in a sticky directory, see
  // fs.protected_regular in proc(5).
  return Descriptor(
      open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_NONBLOCK | O_NOCTTY | O_CLOEXEC, mode));
}

std::error_code writeAll(int descriptor, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
    if (written > 0) {
      bytes.remove_prefix(static_cast<std::size_t>(written));
    } else if (const int error = written < 0 ? errno : ENOSPC;
               !isWorthRepeating(error, descriptor, POLLOUT)) {
      return {error, std::generic_category()};
    }
  }
  return {};
}

std::size_t readSome(int descriptor, char* buffer, std::size_t size) {
  for (;;) {
    const ssize_t count = ::read(descriptor, buffer, size);
    if (count >= 0) return static_cast<std::size_t>(count);
    if (!isWorthRepeating(errno, descriptor, POLLIN)) return 0;
  }
}

}  // namespace posix
