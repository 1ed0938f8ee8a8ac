#pragma once

#include <memory>
#include <vector>

#include "platform/host/log/EntryReader.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/JournalFiles.h"
#include "platform/host/log/StopSignal.h"
#include "platform/oslog_store.h"

/// Journal files, read with systemd's own library, sd-journal(3). In a build without it each
/// function throws `std::runtime_error`, whose text names the package that is missing.
namespace host {

/// Throws `std::runtime_error`, whose text names the file where it is one, when the library cannot
/// read them, each by itself and all at once: one is no journal file, cut off, or of a later
/// version, or there are more than the process may have open.
void checkJournalFiles(const std::vector<JournalFile>& files);

/// A reader of the entries from `from` on. Those that `filter` lets pass are among them; others are
/// left out where the index of the journal can tell. `files`, `filter` and `stop`, which stops the
/// reader, must outlive it.
///
/// What the library skips silently, such as bytes overwritten inside a file, is missing here too.
/// But at the end each file must still be one that the library can read, and one that it has not
/// given up: a file that is truncated or deleted meanwhile is an error. A file that was truncated
/// and is whole again by then, or has holes where nothing was read, looks like one that was not.
std::unique_ptr<EntryReader> readJournal(const std::vector<JournalFile>& files, OSLogDate from,
                                         const EventFilter& filter, const StopSignal& stop);

}  // namespace host
