// Takes the place of JournalReader.cpp where systemd's library is not there.

#include <stdexcept>

#include "platform/host/log/JournalReader.h"

namespace host {
namespace {

[[noreturn]] void refuse() {
  throw std::runtime_error(
      "Cannot read a journal: this program was built without libsystemd. Install libsystemd-dev "
      "and build it anew, or read what journalctl -o export has written");
}

}  // namespace

void checkJournalFiles(const std::vector<JournalFile>&) { refuse(); }

std::unique_ptr<EntryReader> readJournal(const std::vector<JournalFile>&, OSLogDate,
                                         const EventFilter&, const StopSignal&) {
  refuse();
}

}  // namespace host
