#pragma once

#include <chrono>
#include <string>
#include <vector>

#include "platform/host/log/EventFilter.h"
#include "platform/oslog_store.h"

/// What there is to know of a journal before and when journalctl reads it. `folder` names the
/// folder that holds the journal; empty stands for the journal of this machine.
namespace host {

/// Looks at the files of the journal, because journalctl passes over what it may not read, and
/// calls no journal at all an empty one. Throws `std::runtime_error` when there is none, or when
/// not all of it may be read.
void checkJournalFiles(const std::string& folder);

/// Has journalctl open the journal, which may take `patience`. Throws `std::runtime_error` when it
/// is not installed, fails or does not answer.
void checkJournalctl(const std::string& folder, std::chrono::milliseconds patience);

/// The arguments with which journalctl exports the entries from the second of `from` on: all that
/// `filter` lets pass and, where the index of the journal can tell, few others.
std::vector<std::string> exportArguments(const std::string& folder, OSLogDate from,
                                         const EventFilter& filter);

}  // namespace host
