#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/telephony.h"

namespace host {

/// How the device answers one kind of request: with a value, or with a fault.
struct Answer {
  enum class Kind { value, error, nullReply, emptyReply };
  Kind kind = Kind::value;
  std::string text = {};  ///< what the profile says
  std::int32_t code = 0;  ///< of an error

  friend bool operator==(const Answer&, const Answer&) = default;
};

/// The server reports `state` when `at` has passed since the manager was made.
struct ServerStep {
  std::chrono::milliseconds at;
  std::string state;

  friend bool operator==(const ServerStep&, const ServerStep&) = default;
};

enum class Build { internal, carrier, customer };

/// A device as a profile describes it. The default is a phone on which everything works.
struct Profile {
  std::string file;  ///< the path that the profile was read from; empty for none

  int radio = 1;
  int product = static_cast<int>(TelephonyProduct::Phone);
  int radioVendor = 1;
  bool qdss = true;
  Build build = Build::internal;
  std::int32_t compression = 1;
  bool compressionSupported = true;
  std::vector<std::string> processes = {"Orvalind", "modemd"};
  bool hostProcesses = false;  ///< the processes of this machine count as the device's

  std::vector<ServerStep> server = {{std::chrono::milliseconds(0), "Started"}};
  Answer systemLogsMode = {.text = "full"};
  Answer basebandEnabled = {.text = "true"};
  Answer basebandHighThroughput = {.text = "false"};
  Answer dump = {.text = "ok"};
  std::optional<std::string> dumpTimestamp;  ///< none: the time of the answer
  std::chrono::milliseconds dumpDelay{0};

  bool helperExists = true;
  Answer helper = {.text = "ok"};
  std::optional<std::string> helperTimestamp;

  std::string requestLog;  ///< path; empty for none

  std::string log = "sample";   ///< "sample", "journal", or a path
  std::string logPrepareError;  ///< empty when the store can be prepared
  bool hasLogPath() const { return log != "sample" && log != "journal"; }
  std::optional<unsigned long> logEnd = 5;  ///< the reason of a stream's end; none: it does not end

  friend bool operator==(const Profile&, const Profile&) = default;
};

/// Reads `text`, the contents of the profile `file`, into `profile`. Keys that it does not set keep
/// their values. The path of a log is relative to the folder of `file`. Returns the first fault as
/// "FILE:LINE: what", or nothing.
std::optional<std::string> parseProfile(std::string_view text, const std::string& file,
                                        Profile& profile);

}  // namespace host
