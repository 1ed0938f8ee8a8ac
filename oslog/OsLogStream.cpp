#include "oslog/OsLogStream.h"

#include <atomic>
#include <charconv>
#include <mutex>
#include <new>

#include "platform/oslog_store.h"
#include "platform/system.h"

namespace {

constexpr std::uint64_t kStreamFlags = 21;  // the bits are the log store's

using StreamHandle = std::shared_ptr<OSLogEventStream>;

/// The file of one export. The store's thread may still append lines when the export is over: a
/// closed file takes none.
class LineFile {
 public:
  explicit LineFile(std::unique_ptr<platform::FileHandle> opened) : file(std::move(opened)) {}

  /// Writes `line`, unless the file is closed. Returns why not all of it could be written, if so;
  /// that closes the file.
  std::error_code append(const std::string& line) {
    std::error_code failure;
    {
      const std::lock_guard lock(mutex);
      if (!closing) failure = file->write(line);
      if (failure) failed = closing = true;
    }
    if (closing) close();
    return failure;
  }

  /// Closes the file because a line is missing from it.
  void fail() {
    failed = true;
    close();
  }

  /// Does not wait for a line that is being written, which a stalled reader may hold up without
  /// end: the file then closes after that line.
  void close() {
    closing = true;
    if (const std::unique_lock lock(mutex, std::try_to_lock); lock) file.reset();
  }

  bool hasFailed() const { return failed; }

 private:
  std::mutex mutex;
  std::unique_ptr<platform::FileHandle> file;
  std::atomic<bool> closing = false;
  std::atomic<bool> failed = false;
};

/// Prepares the local store. Returns an empty pointer, with the reason in the system log, when that
/// fails.
StreamHandle PrepareStream() {
  struct Outcome {
    std::mutex mutex;
    StreamHandle stream;
  };
  // Shared with the handler, so that one which is called too late writes to what still exists.
  const auto outcome = std::make_shared<Outcome>();
  OSLogEventStore::localStore()->prepareWithCompletionHandler(
      [outcome](const std::shared_ptr<OSLogEventSource>& source,
                const std::optional<std::string>& error) {
        if (error) return platform::logError("Could not open: " + *error);
        const std::lock_guard lock(outcome->mutex);
        outcome->stream = OSLogEventStream::initWithSource(source);
      });
  const std::lock_guard lock(outcome->mutex);
  if (!outcome->stream) platform::logError("Failed to prepare oslog stream");
  return std::move(outcome->stream);
}

void SetFilter(OSLogEventStream& stream, const std::list<std::string>& processes,
               const std::list<std::string>& imagePaths) {
  OSLogOrPredicate filter;
  for (const auto& process : processes) filter.terms.push_back({"process == %@", process});
  for (const auto& path : imagePaths) {
    filter.terms.push_back({"senderImagePath CONTAINS[cd] %@", path});
  }
  if (!filter.terms.empty()) stream.setFilterPredicate(std::move(filter));
}

/// Appends `number` to `text`, in at least `leastDigits` digits.
template <class Number>
void AppendNumber(std::string& text, Number number, int base = 10, std::size_t leastDigits = 1) {
  char digits[20];  // of any 64-bit number
  const char* const end = std::to_chars(digits, std::end(digits), number, base).ptr;
  const auto length = static_cast<std::size_t>(end - digits);
  if (length < leastDigits) text.append(leastDigits - length, '0');
  text.append(digits, length);
}

/// Makes `line` "DATE 0xTHREAD 0xACTIVITY PID PROCESS(SENDER):SUBSYSTEM [CATEGORY] MESSAGE\n", the
/// date being the wall-clock time of the device that logged.
void FormatLine(const OSLogEventProxy& event, std::string& line) {
  line.clear();
  const auto date = event.date();
  date.addingSeconds(event.timeZone().secondsFromGMT(date)).appendDescription(line);
  line.append(" 0x");
  AppendNumber(line, event.threadIdentifier(), 16, 5);
  line.append(" 0x");
  AppendNumber(line, event.activityIdentifier(), 16);
  line.push_back(' ');
  AppendNumber(line, event.processIdentifier());
  line.append(" ").append(event.process()).append("(").append(event.sender());
  line.append("):").append(event.subsystem()).append(" [").append(event.category());
  line.append("] ").append(event.composedMessage()).append("\n");
}

/// Appends the line of `event`, made in `line`. Returns why that was not possible, if so; the file
/// is then closed.
std::error_code AppendLine(LineFile& file, const OSLogEventProxy& event, std::string& line) {
  try {
    FormatLine(event, line);
    return file.append(line);
  } catch (const std::bad_alloc&) {
    file.fail();
    return std::make_error_code(std::errc::not_enough_memory);
  }
}

void SetHandlers(const StreamHandle& stream, const std::shared_ptr<LineFile>& file,
                 const std::string& path, const dispatch::group& group) {
  const std::weak_ptr<OSLogEventStream> weakStream = stream;  // the stream owns its handlers
  stream->setEventHandler(
      [file, path, weakStream, line = std::string()](const OSLogEventProxy& event) mutable {
        if (event.type() != kOSLogEventTypeLogMessage) return;
        const auto failure = AppendLine(*file, event, line);
        if (!failure) return;
        platform::logError("Failed to write file: " + path + ": " + failure.message());
        if (const auto failing = weakStream.lock()) failing->invalidate();
      });
  stream->setInvalidationHandler([group](unsigned long reason, const OSLogEventStreamPosition&) {
    try {
      if (reason != kOSLogEventStreamEndOfLog) {
        platform::logError("Invalid oslog stream: reason = " + std::to_string(reason));
      }
    } catch (const std::bad_alloc&) {  // it ends all the same
    }
    group.leave();
  });
}

/// Streams the last `history` seconds. True when the stream ended within `timeout`.
bool RunStream(OSLogEventStream& stream, const dispatch::group& group, double history,
               std::chrono::nanoseconds timeout) {
  const auto start = OSLogDate::now().addingSeconds(-history);
  group.enter();
  platform::logError("Getting oslog stream: history = " + std::to_string(history));
  stream.activateStreamFromDate(start);
  if (group.wait(timeout)) return true;
  stream.invalidate();
  platform::logError("Timeout on getting oslog stream");
  return false;
}

}  // namespace

bool OsLogStream::putOsLogStreamToFile(const std::string& path,
                                       const std::list<std::string>& process,
                                       const std::list<std::string>& imagePath, double history) {
  return putWithin(kTimeout, path, process, imagePath, history);
}

bool OsLogStream::putWithin(std::chrono::nanoseconds timeout, const std::string& path,
                            const std::list<std::string>& process,
                            const std::list<std::string>& imagePath, double history) {
  const auto stream = PrepareStream();
  if (!stream) return false;
  auto opened = platform::FileHandle::createEmpty(path);
  if (!opened) {
    platform::logError("Failed to create file: " + path);
    return false;
  }
  const auto group = dispatch::group::create();
  if (!group) {
    platform::logError("Failed to get group");
    return false;
  }
  const auto file = std::make_shared<LineFile>(std::move(opened));
  stream->setFlags(kStreamFlags);
  SetFilter(*stream, process, imagePath);
  SetHandlers(stream, file, path, group);
  const bool ended = RunStream(*stream, group, history, timeout);
  file->close();
  return ended && !file->hasFailed();
}
