#include "platform/host/log/LogSource.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>
#include <system_error>
#include <vector>

#include "platform/host/device/Device.h"
#include "platform/host/log/Journal.h"
#include "platform/host/log/JournalProcess.h"
#include "platform/host/log/SampleLog.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/files.h"

namespace host {
namespace {

std::string reason(int error) { return std::generic_category().message(error); }

/// The bytes of a text.
class TextBytes final : public ByteSource {
 public:
  explicit TextBytes(std::string given) : text(std::move(given)) {}

  std::int64_t read(char* buffer, std::size_t size) override {
    const std::size_t count = text.copy(buffer, size, position);
    position += count;
    return static_cast<std::int64_t>(count);
  }

 private:
  std::string text;
  std::size_t position = 0;
};

/// The bytes that a descriptor gives: of a file, from its start, whoever else reads it.
class DescriptorBytes final : public ByteSource {
 public:
  DescriptorBytes(int opened, const StopSignal& signal)
      : descriptor(opened), stop(signal), isFile(::lseek(opened, 0, SEEK_CUR) >= 0) {}

  std::int64_t read(char* buffer, std::size_t size) override {
    while (stop.waitReadable(descriptor)) {
      const ssize_t count =
          isFile ? ::pread(descriptor, buffer, size, offset) : ::read(descriptor, buffer, size);
      if (count >= 0) {
        offset += count;
        return count;
      }
      if (errno != EINTR && errno != EAGAIN) return kFailed;
    }
    return kStopped;
  }

 private:
  int descriptor;
  const StopSignal& stop;
  bool isFile;
  off_t offset = 0;
};

/// What a journalctl writes, which ends well only if the process does, without a complaint: it
/// passes over files that it cannot open, and says so on standard error alone.
class JournalBytes final : public ByteSource {
 public:
  JournalBytes(const std::vector<std::string>& arguments, const StopSignal& signal)
      : process(arguments), output(process.output(), signal) {}

  std::int64_t read(char* buffer, std::size_t size) override {
    const std::int64_t count = output.read(buffer, size);
    if (count != kEnd) return count;
    const bool whole = process.succeeded(kTimeToEnd).value_or(false) && process.messages().empty();
    return whole ? kEnd : kFailed;
  }

 private:
  static constexpr std::chrono::milliseconds kTimeToEnd = std::chrono::seconds(5);

  JournalProcess process;
  DescriptorBytes output;
};

class SampleSource final : public LogSource {
 public:
  std::unique_ptr<ByteSource> open(OSLogDate, const EventFilter&,
                                   const StopSignal&) const override {
    return std::make_unique<TextBytes>(sampleLog(OSLogDate::now()));
  }
};

class RecordedSource final : public LogSource {
 public:
  explicit RecordedSource(posix::Descriptor opened) : descriptor(std::move(opened)) {}

  std::unique_ptr<ByteSource> open(OSLogDate, const EventFilter&,
                                   const StopSignal& stop) const override {
    return std::make_unique<DescriptorBytes>(descriptor.get(), stop);
  }

 private:
  posix::Descriptor descriptor;
};

class JournalSource final : public LogSource {
 public:
  /// `journalFolder` is empty for the journal of this machine.
  explicit JournalSource(std::string journalFolder) : folder(std::move(journalFolder)) {}

  std::unique_ptr<ByteSource> open(OSLogDate from, const EventFilter& filter,
                                   const StopSignal& stop) const override {
    return std::make_unique<JournalBytes>(exportArguments(folder, from, filter), stop);
  }

 private:
  std::string folder;
};

std::shared_ptr<LogSource> prepareJournal(const std::string& folder,
                                          std::chrono::milliseconds patience) {
  checkJournalFiles(folder);
  checkJournalctl(folder, patience);
  return std::make_shared<JournalSource>(folder);
}

}  // namespace

std::shared_ptr<LogSource> prepareLog(const std::string& log, std::chrono::milliseconds patience) {
  if (log == "sample") return std::make_shared<SampleSource>();
  if (log == "journal") return prepareJournal("", patience);
  // Not to wait here for a pipe's writer: that is for the reading, which can be stopped.
  posix::Descriptor opened(::open(log.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  struct stat about {};
  if (!opened || ::fstat(opened.get(), &about) != 0) {
    throw std::runtime_error(log + ": " + reason(errno));
  }
  if (S_ISDIR(about.st_mode)) return prepareJournal(log, patience);
  return std::make_shared<RecordedSource>(std::move(opened));
}

}  // namespace host

bool posix::isReadByDevice(const std::string& path) {
  const host::Profile& device = host::device();
  struct stat file {};
  struct stat log {};
  return device.hasLogPath() && stat(path.c_str(), &file) == 0 &&
         stat(device.log.c_str(), &log) == 0 && file.st_dev == log.st_dev &&
         file.st_ino == log.st_ino;
}
