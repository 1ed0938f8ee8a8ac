// Any bytes as a recorded log: read in pieces of a size that the first byte gives, with all that
// can be asked of each event. What the reader says must not depend on the pieces.

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>

#include "platform/host/log/EntryReader.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/LogEvent.h"
#include "platform/posix/Utf8.h"

namespace {

using host::EntryReader;

class Pieces final : public host::ByteSource {
 public:
  Pieces(std::string_view bytes, std::size_t most) : rest(bytes), piece(most) {}

  std::int64_t read(char* buffer, std::size_t size) override {
    const std::size_t count = rest.copy(buffer, std::min(size, piece));
    rest.remove_prefix(count);
    return static_cast<std::int64_t>(count);
  }

 private:
  std::string_view rest;
  std::size_t piece;
};

void require(bool holds) {
  if (!holds) std::abort();
}

void add(std::string& told, std::string_view text) {
  require(posix::isUtf8(text));
  told.append(text).append("|");
}

/// All that the log says.
std::string read(std::string_view log, std::size_t piece, const host::EventFilter& filter) {
  Pieces source(log, piece);
  EntryReader reader(source);
  const host::LogEvent event(reader.entry());
  std::string told;
  EntryReader::Result result = reader.next();
  for (; result == EntryReader::Result::entry; result = reader.next()) {
    add(told, event.process());
    add(told, event.sender());
    add(told, event.subsystem());
    add(told, event.category());
    add(told, event.composedMessage());
    add(told, event.senderImagePath());
    event.date().appendDescription(told);
    told += std::to_string(event.type() + event.threadIdentifier() + event.activityIdentifier());
    told += std::to_string(event.processIdentifier());
    told += std::to_string(event.timeZone().secondsFromGMT(event.date()));
    told += filter.passes(event) ? '+' : '-';
  }
  require(result == EntryReader::Result::end || result == EntryReader::Result::damaged);
  require(reader.next() == result);
  require(reader.damage().offset <= log.size());
  return told + reader.damage().what + std::to_string(reader.damage().offset);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::string_view log(reinterpret_cast<const char*>(data) + 1, size - 1);
  const host::EventFilter filter(
      {{{"process == %@", "sshd"}, {"senderImagePath CONTAINS[cd] %@", "Modemcoré"}}});
  require(read(log, std::size_t{data[0]} + 1, filter) == read(log, size, filter));
  return 0;
}
