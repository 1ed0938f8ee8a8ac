#pragma once

#include <string>

#include "logdump/LogdumpOptions.h"

/// Where collected logs are written, and how they are named. Both folders end with "/".
namespace zub::trace {

inline constexpr auto kScratchFolder = "/private/var/wireless/Library/Logs/ZubServer/";
inline constexpr auto kSnapshotFolder = "/private/var/wireless/Library/Logs/CrashVault/Baseband/";
inline constexpr auto kLogTarExtension = "tar";
inline constexpr auto kLogTarGzExtension = "tar.gz";
inline constexpr auto kLogDirPrefix = "log-bb-";
inline constexpr auto kKOVTraceSnapshotDirectorySuffix = "-bb-trace";
inline constexpr auto kZATTraceSnapshotDirectorySuffix = "-diag";
inline constexpr auto kZATQDSSTraceSnapshotDirectorySuffix = "-qdss";

/// The suffix of a snapshot folder on this radio; `qdss` says whether high-throughput tracing is
/// on. Asks for the radio's vendor at every call.
std::string getBasebandTraceDirSuffix(bool qdss);

/// The suffix of a core dump folder on this radio. The vendor is asked once, by the first call in
/// the process; every later call gives the same text.
std::string getCoreDumpDirSuffix();

}  // namespace zub::trace

namespace diag::config {

inline constexpr auto kDIAGScratchDir = "DIAG.scratch";
inline constexpr auto kQDSSScratchDir = "QDSS.scratch";

}  // namespace diag::config

/// The path of the logs that the server has collected at `timestamp`. An archive's extension takes
/// the place of `defaultSuffix`, which follows as it is when there is no archive. Cannot fail.
std::string buildLogPath(const std::string& timestamp, CompressionMode mode,
                         const std::string& defaultSuffix);
