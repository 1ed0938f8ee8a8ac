#pragma once

#include <memory>

#include "platform/host/log/EntryReader.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/JournalFiles.h"
#include "platform/host/log/StopSignal.h"
#include "platform/oslog_store.h"

/// Journal files, read with systemd's own library, sd-journal(3). In a build without it each
/// function throws `std::runtime_error`, whose text names the package that is missing.
namespace host {

/// Throws `std::runtime_error`, whose text names the file, when the library cannot read it: it is
/// no journal file, cut off, or of a later version.
void checkJournalFile(const JournalFile& file);

/// A reader of the entries from `from` on. Those that `filter` lets pass are among them; others are
/// left out where the index of the journal can tell. `filter` and `stop`, which stops the reader,
/// must outlive it.
///
/// What the library passes over in silence, such as bytes overwritten inside a file, is missing in
/// silence here as well. But each file must still pass the check above at the end, so one that has
/// been truncated or deleted meanwhile, of which the library may have read less, is an error.
std::unique_ptr<EntryReader> readJournal(std::vector<JournalFile> files, OSLogDate from,
                                         const EventFilter& filter, const StopSignal& stop);

}  // namespace host
