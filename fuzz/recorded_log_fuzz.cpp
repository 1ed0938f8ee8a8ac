// A recorded log that is built out of parts, as the input says, or any bytes as one: read in pieces
// of a size that the first byte gives, with all that can be asked of each event. What the reader
// says must not depend on the pieces.

#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>

#include "fuzz/RecordedLogs.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/LogEvent.h"
#include "platform/host/log/RecordedLogReader.h"
#include "platform/posix/Utf8.h"

namespace {

void require(bool holds) {
  if (!holds) std::abort();
}

void add(std::string& seen, std::string_view text) {
  require(posix::isUtf8(text));
  seen.append(text).append("|");
}

void addAll(std::string& seen, const host::LogEntry& entry, const host::EventFilter& filter) {
  std::string texts;
  const host::LogEvent event(entry, texts);
  add(seen, event.process());
  add(seen, event.sender());
  add(seen, event.subsystem());
  add(seen, event.category());
  add(seen, event.composedMessage());
  event.date().appendDescription(seen);
  seen += std::to_string(event.type() + event.threadIdentifier() + event.activityIdentifier());
  seen += std::to_string(event.processIdentifier());
  seen += std::to_string(event.timeZone().secondsFromGMT(event.date()));
  seen += filter.passes(entry) ? '+' : '-';
}

/// All that the log says.
std::string read(std::string_view log, std::size_t piece, const host::EventFilter& filter) {
  const auto reader = host::readRecordedLog(pieces(log, piece));
  std::string seen;
  try {
    while (reader->next()) addAll(seen, reader->entry(), filter);
  } catch (const host::DamagedLog& damage) {
    seen += damage.what();
  }
  return seen;
}

/// A run of one byte, so long that it and what surrounds it end near the end of the buffer.
std::string longRun(unsigned char seed) {
  const std::size_t size = host::kRecordedLogBuffer - 64 + seed % 128;
  return std::string(size, seed < 128 ? 'v' : '\xE4');
}

/// A log of whole fields and entries: each two bytes of `recipe` are a part and its seed. At most
/// `mostLong` parts are long, so that fields and entries lie across the end of the buffer.
std::string build(std::string_view recipe, int mostLong) {
  std::string log;
  int longOnes = 0;
  for (; recipe.size() >= 2; recipe.remove_prefix(2)) {
    const auto seed = static_cast<unsigned char>(recipe[1]);
    const std::string shortRun(seed, static_cast<char>(seed));
    const std::string run = recipe[0] % 2 != 0 && longOnes++ < mostLong ? longRun(seed) : "s";
    switch (static_cast<unsigned char>(recipe[0]) / 2 % 8) {
      case 0:
        log += "__REALTIME_TIMESTAMP=17000000" + std::to_string(seed) + "\n";
        break;
      case 1:
        log += "MESSAGE=" + run + "\n";
        break;
      case 2:
        log += "_EXE=/usr/" + run + "\n";
        break;
      case 3:
        log += binary("MESSAGE", run);
        break;
      case 4:
        log += binary("UNWANTED", shortRun + run);
        break;
      case 5:
        log += "_COMM=sshd\\" + std::to_string(seed) + "\n";
        break;
      case 6:
        log += "UNWANTED=" + run + "\n";
        break;
      default:
        log += "\n";
    }
  }
  return log;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::string_view rest(reinterpret_cast<const char*>(data) + 1, size - 1);
  const bool built = data[0] % 2 != 0;
  const std::string log = built ? build(rest, data[0] % 4 == 3 ? 2 : 0) : std::string(rest);
  const host::EventFilter filter(
      {{{"process == %@", "sshd"}, {"senderImagePath CONTAINS[cd] %@", "Modemcoré"}}});
  const std::size_t piece = built ? std::size_t{data[0]} * 1'009 : std::size_t{data[0]} / 2 + 1;
  require(read(log, piece, filter) == read(log, log.size() + 1, filter));
  return 0;
}
