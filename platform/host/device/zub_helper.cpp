#include "platform/zub_helper.h"

#include "platform/host/device/Device.h"
#include "platform/host/device/Requests.h"

namespace zub {
namespace helper {

const char* const kCommandSysreportStatus = "SysreportStatus";
const char* const kKeyTimeout = "Timeout";
const char* const kKeyTimestampString = "TimestampString";

}  // namespace helper

namespace {

class SimulatedHelper : public HelperClient {
 public:
  TelephonyLumo::Result perform(helper::TaskID task, const std::string& command,
                                const lumo::dict& parameters, lumo::object* reply) override {
    host::recordRequest("helper " + command + " task=" + std::to_string(task) + " " +
                        host::describe(parameters));
    const auto& device = host::device();
    return host::answerWith(device.helper, helper::kKeyTimestampString,
                            host::timestampOr(device.helperTimestamp), reply);
  }
};

}  // namespace

std::shared_ptr<HelperClient> HelperClient::create(const std::string& /*name*/,
                                                   std::shared_ptr<tlu::LogServer> /*logServer*/) {
  if (!host::device().helperExists) return nullptr;
  return std::make_shared<SimulatedHelper>();
}

}  // namespace zub
