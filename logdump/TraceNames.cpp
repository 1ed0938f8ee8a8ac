#include "logdump/TraceNames.h"

#include "platform/telephony.h"

namespace {

bool IsKOV() { return TelephonyRadiosGetRadioVendor() == kTelephonyRadioVendorKOV; }

/// The extension of an archive, or `defaultSuffix` if `mode` makes none.
std::string ExtensionOf(CompressionMode mode, const std::string& defaultSuffix) {
  if (mode == CompressionMode::tarGz) return std::string(".") + zub::trace::kLogTarGzExtension;
  if (mode == CompressionMode::tar) return std::string(".") + zub::trace::kLogTarExtension;
  return defaultSuffix;
}

}  // namespace

namespace zub::trace {

std::string getBasebandTraceDirSuffix(bool qdss) {
  if (IsKOV()) return kKOVTraceSnapshotDirectorySuffix;
  return qdss ? kZATQDSSTraceSnapshotDirectorySuffix : kZATTraceSnapshotDirectorySuffix;
}

std::string getCoreDumpDirSuffix() {
  static const char* const suffix = IsKOV() ? "-coredump" : "-cd";
  return suffix;
}

}  // namespace zub::trace

std::string buildLogPath(const std::string& timestamp, CompressionMode mode,
                         const std::string& defaultSuffix) {
  return std::string(zub::trace::kSnapshotFolder) + zub::trace::kLogDirPrefix + timestamp +
         ExtensionOf(mode, defaultSuffix);
}
