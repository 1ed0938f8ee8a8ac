#pragma once

#include <string>

#include "logdump/LogdumpOptions.h"

/// Folders and names of collected logs. Both folders end with "/".
namespace zub::trace {

inline constexpr auto kScratchFolder = "/private/var/wireless/Library/Logs/ZubServer/";
inline constexpr auto kSnapshotFolder = "/private/var/wireless/Library/Logs/CrashVault/Baseband/";
inline constexpr auto kLogTarExtension = "tar";
inline constexpr auto kLogTarGzExtension = "tar.gz";
inline constexpr auto kLogDirPrefix = "log-bb-";
inline constexpr auto kKOVTraceSnapshotDirectorySuffix = "-bb-trace";
inline constexpr auto kZATTraceSnapshotDirectorySuffix = "-diag";
inline constexpr auto kZATQDSSTraceSnapshotDirectorySuffix = "-qdss";

/// The suffix of a snapshot folder for this radio's vendor, which it asks for at every call.
/// `qdss`: whether high-throughput tracing is on.
std::string getBasebandTraceDirSuffix(bool qdss);

/// The suffix of a core dump folder for this radio's vendor. The first call in the process asks for
/// the vendor; later calls return the same text. Any thread.
std::string getCoreDumpDirSuffix();

}  // namespace zub::trace

namespace diag::config {

inline constexpr auto kDIAGScratchDir = "DIAG.scratch";
inline constexpr auto kQDSSScratchDir = "QDSS.scratch";

}  // namespace diag::config

/// The path of the logs that were collected at `timestamp`. It ends in the extension of the
/// archive, or in `defaultSuffix` if `mode` makes none. Cannot fail.
std::string buildLogPath(const std::string& timestamp, CompressionMode mode,
                         const std::string& defaultSuffix);
