#include "platform/host/log/LogSource.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <filesystem>
#include <stdexcept>
#include <string_view>
#include <system_error>

#include "platform/host/device/Device.h"
#include "platform/host/log/JournalFiles.h"
#include "platform/host/log/JournalReader.h"
#include "platform/host/log/RecordedLogReader.h"
#include "platform/host/log/SampleLog.h"
#include "platform/posix/Descriptor.h"

namespace host {
namespace {

class RecordedSource final : public LogSource {
 public:
  RecordedSource(std::string name, posix::Descriptor opened)
      : path(std::move(name)), descriptor(std::move(opened)) {}

  std::unique_ptr<EntryReader> open(OSLogDate, const EventFilter&,
                                    const StopSignal& stop) const override {
    const auto readBytes = [this, &stop, offset = off_t{0}](char* buffer,
                                                            std::size_t size) mutable {
      const auto count = read(buffer, size, offset, stop);
      offset += static_cast<off_t>(count.value_or(0));
      return count;
    };
    return readRecordedLog(readBytes);
  }

 private:
  /// Reads what a file has at `offset`, whoever else reads it; of anything else, what comes next.
  /// Nothing when stopped.
  std::optional<std::size_t> read(char* buffer, std::size_t size, off_t offset,
                                  const StopSignal& stop) const {
    while (stop.waitReadable(descriptor.get())) {
      ssize_t count = ::pread(descriptor.get(), buffer, size, offset);
      if (count < 0 && errno == ESPIPE) count = ::read(descriptor.get(), buffer, size);
      if (count == 0 && end() < endAtFirst) {
        throw std::runtime_error(path + ": truncated while it was read");
      }
      if (count >= 0) return static_cast<std::size_t>(count);
      if (errno != EINTR && errno != EAGAIN) {
        throw std::system_error(errno, std::generic_category(), path);
      }
    }
    return std::nullopt;
  }

  /// The size of a file; -1 for what has none.
  off_t end() const { return ::lseek(descriptor.get(), 0, SEEK_END); }

  std::string path;
  posix::Descriptor descriptor;
  const off_t endAtFirst = end();
};

/// The files of a journal, as it was when it was prepared.
class JournalSource final : public LogSource {
 public:
  /// As `openJournalFiles` and `checkJournalFiles`.
  explicit JournalSource(const std::string& journal) : files(openJournalFiles(journal)) {
    checkJournalFiles(files);
  }

  std::unique_ptr<EntryReader> open(OSLogDate from, const EventFilter& filter,
                                    const StopSignal& stop) const override {
    return readJournal(files, from, filter, stop);
  }

 private:
  std::vector<JournalFile> files;
};

/// Whether the file is a journal file: what it begins with, see systemd's description of the
/// journal file format.
bool isJournalFile(int descriptor) {
  constexpr std::string_view kSignature = "LPKSHHRH";
  std::array<char, kSignature.size()> start{};
  return ::pread(descriptor, start.data(), start.size(), 0) == static_cast<ssize_t>(start.size()) &&
         std::string_view(start.data(), start.size()) == kSignature;
}

/// A file in memory that holds `text`.
posix::Descriptor memoryFile(std::string_view text) {
  posix::Descriptor file(::memfd_create("log", MFD_CLOEXEC));
  const std::error_code failure =
      file ? posix::writeAll(file.get(), text) : std::error_code(errno, std::generic_category());
  if (failure) throw std::system_error(failure, "memfd");
  return file;
}

}  // namespace

std::shared_ptr<LogSource> prepareLog(const std::string& log) {
  if (log == "sample") {
    return std::make_shared<RecordedSource>(log, memoryFile(sampleLog(OSLogDate::now())));
  }
  if (log == "journal") return std::make_shared<JournalSource>("");
  // Not to wait here for a pipe's writer: that is for the reading, which can be stopped.
  posix::Descriptor opened(::open(log.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  struct stat about = {};
  if (!opened || ::fstat(opened.get(), &about) != 0) {
    throw std::runtime_error(log + ": " + std::generic_category().message(errno));
  }
  if (S_ISDIR(about.st_mode) || isJournalFile(opened.get())) {
    return std::make_shared<JournalSource>(log);
  }
  return std::make_shared<RecordedSource>(log, std::move(opened));
}

}  // namespace host

bool posix::isReadByDevice(const std::string& path) {
  const host::Profile& device = host::device();
  if (std::error_code none; std::filesystem::equivalent(path, device.file, none)) return true;
  if (device.log == "sample") return false;
  return host::isOfJournal(device.hasLogPath() ? device.log : "", path);
}
