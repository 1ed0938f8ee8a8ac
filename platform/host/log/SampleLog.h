#pragma once

#include <string>

#include "platform/oslog_store.h"

namespace host {

/// A recorded log of a few events of the minutes before `now`, such as a phone would have: of the
/// telephony processes and one that has nothing to do with them, in the order of time.
std::string sampleLog(OSLogDate now);

}  // namespace host
