#pragma once

#include <set>
#include <string>
#include <vector>

#include "platform/host/log/FoldedText.h"
#include "platform/host/log/LogEntry.h"
#include "platform/oslog_store.h"

namespace host {

/// Decides which events a stream delivers. Threads: any, after it has been made.
class EventFilter {
 public:
  /// Lets every event pass.
  EventFilter() = default;

  /// Lets an event pass for which `predicate` is true: none if it has no terms. Throws
  /// `std::invalid_argument` for a format that `OSLogPredicate` does not list.
  explicit EventFilter(OSLogOrPredicate predicate);

  /// Whether it lets the event pass that `entry` stands for.
  bool passes(const LogEntry& entry) const;

 private:
  bool everything = true;
  std::set<std::string, std::less<>> names;
  std::vector<FoldedText> pathParts;
};

}  // namespace host
