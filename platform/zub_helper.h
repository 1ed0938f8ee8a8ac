#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "platform/lumo.h"
#include "platform/telephony.h"
#include "platform/zub_client.h"

/// Names of the protocol of the helper service. The client library defines them.
namespace zub::helper {

/// Identifies a task of the helper service. The tool uses 4, the system report.
using TaskID = std::int32_t;

extern const char* const kCommandSysreportStatus;
extern const char* const kKeyTimeout;
extern const char* const kKeyTimestampString;

}  // namespace zub::helper

namespace zub {

/// A client of the privileged helper service, which answers also while the server does not run.
class HelperClient {
 public:
  /// Makes a client called `name` that logs to `logServer`, which may be null. Returns null when
  /// the service cannot be reached.
  static std::shared_ptr<HelperClient> create(const std::string& name,
                                              std::shared_ptr<tlu::LogServer> logServer);

  virtual ~HelperClient() = default;

  /// Performs a task and blocks until it is done. `*reply` must be an empty dictionary; it receives
  /// the reply of a task that succeeded.
  virtual TelephonyLumo::Result perform(helper::TaskID task, const std::string& command,
                                        const lumo::dict& parameters, lumo::object* reply) = 0;
};

}  // namespace zub
