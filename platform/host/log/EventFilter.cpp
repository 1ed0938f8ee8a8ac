#include "platform/host/log/EventFilter.h"

#include <algorithm>
#include <stdexcept>

#include "platform/host/log/LogEvent.h"

namespace host {

EventFilter::EventFilter(OSLogOrPredicate predicate) : everything(false) {
  for (OSLogPredicate& term : predicate.terms) {
    if (term.format == "process == %@") {
      names.insert(std::move(term.value));
    } else if (term.format == "senderImagePath CONTAINS[cd] %@") {
      pathParts.emplace_back(term.value);
    } else {
      throw std::invalid_argument("not a predicate of the log store: " + term.format);
    }
  }
}

bool EventFilter::passes(const LogEntry& entry) const {
  if (everything) return true;
  if (!names.empty() && names.contains(processOf(entry))) return true;
  const std::string_view path = imagePathOf(entry);
  return std::ranges::any_of(pathParts, [path](const FoldedText& part) { return part.isIn(path); });
}

}  // namespace host
