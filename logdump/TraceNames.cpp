#include "logdump/TraceNames.h"

#include "platform/telephony.h"

namespace zub::trace {
namespace {

bool isKOV() { return TelephonyRadiosGetRadioVendor() == kTelephonyRadioVendorKOV; }

}  // namespace

std::string getBasebandTraceDirSuffix(bool qdss) {
  if (isKOV()) return kKOVTraceSnapshotDirectorySuffix;
  return qdss ? kZATQDSSTraceSnapshotDirectorySuffix : kZATTraceSnapshotDirectorySuffix;
}

std::string getCoreDumpDirSuffix() {
  static const char* const suffix = isKOV() ? "-coredump" : "-cd";
  return suffix;
}

}  // namespace zub::trace
