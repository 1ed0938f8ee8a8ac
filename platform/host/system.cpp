#include "platform/system.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>

#include "platform/host/device/Device.h"

const char* getprogname() { return program_invocation_short_name; }

namespace platform {
namespace {

/// Whether the file at `path` is the very log that this device reads: it is not for writing.
bool isTheLog(const std::string& path) {
  struct stat file {};
  struct stat log {};
  return host::device().hasLogPath() && stat(path.c_str(), &file) == 0 &&
         stat(host::device().log.c_str(), &log) == 0 && file.st_dev == log.st_dev &&
         file.st_ino == log.st_ino;
}

}  // namespace

void runMainEventLoop() {
  for (;;) pause();  // the callbacks of this platform run on threads of their own
}

void createEmptyFile(const std::string& path) {
  struct stat present {};
  if (stat(path.c_str(), &present) == 0 && !S_ISREG(present.st_mode)) return;
  if (isTheLog(path)) return;
  constexpr mode_t kForAll = 0666;  // less the process's file mode creation mask
  const int made = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, kForAll);
  if (made >= 0) ::close(made);
}

FileHandle FileHandle::openForAppending(const std::string& path) {
  if (isTheLog(path)) return FileHandle(-1);
  // A pipe without a reader would block an open for writing, and for good: O_NONBLOCK refuses it.
  const int opened = open(path.c_str(), O_WRONLY | O_APPEND | O_NONBLOCK | O_CLOEXEC);
  if (opened >= 0) fcntl(opened, F_SETFL, O_APPEND);  // the writes themselves may block
  return FileHandle(opened);
}

bool FileHandle::write(std::string_view bytes) {
  ssize_t written = -1;
  do {
    written = ::write(descriptor, bytes.data(), bytes.size());
  } while (written < 0 && errno == EINTR);
  return written >= 0 && static_cast<std::size_t>(written) == bytes.size();
}

void FileHandle::close() noexcept {
  if (descriptor >= 0) ::close(std::exchange(descriptor, -1));
}

void logError(const std::string& message) { syslog(LOG_ERR, "%s", message.c_str()); }

}  // namespace platform
