#include <iostream>

#include "logdump/LogdumpCommand.h"
#include "logdump/LogdumpOptions.h"
#include "logdump/TraceNames.h"
#include "logdump/TraceProperty.h"
#include "platform/telephony.h"
#include "platform/zub_helper.h"

namespace {

void PrintLine(const std::string& line) { std::cout << line << std::endl; }

void ReadFlag(const lumo::object& reply, bool& flag) {
  parseBoolProperty(
      lumo::dyn_cast_or_default(reply.get(zub::kKeyTracePropertyValue), zub::kUnknown), flag);
}

/// Whether the baseband trace uses QDSS. `query` asks for another property of that trace.
bool IsHighThroughputOn(const std::shared_ptr<zub::client::Manager>& manager, lumo::dict query) {
  bool on = false;
  if (!TelephonyCapabilitiesRadioDIAGSupportsQDSS()) return on;
  query.set(zub::kKeyTracePropertyName, zub::kKeyTraceHighTput);
  lumo::object reply;
  const auto result =
      zub::client::PerformCommand(manager, zub::kCommandGetTraceProperty, query, &reply);
  if (result.code == 0 && reply.isDict()) ReadFlag(reply, on);
  return on;
}

/// The request for a dump, with what the option words ask for and the device allows. Stores the
/// packaging in `mode` as well.
lumo::dict DumpRequest(const LogdumpCommand& node, const std::list<std::string>& words,
                       CompressionMode& mode) {
  mode = static_cast<CompressionMode>(defaults::compression::mode());
  std::string reason;
  bool noUi = false;  // this collection asks for no confirmation
  parseLogdumpOptions(words, mode, reason, noUi);
  if (node.isSystemLogsTraceLite() || !defaults::compression::supported()) {
    mode = CompressionMode::none;
  }
  return {{zub::kKeyTraceDumpStateReason, reason},
          {zub::kKeyTraceAction, zub::kCollectBasebandLogs},
          {zub::kKeyTraceDumpStatePerformCompression, static_cast<std::int64_t>(mode)}};
}

/// The timestamp of the helper service's system report; empty when there is none.
std::string AskHelperForTimestamp() {
  constexpr zub::helper::TaskID kSystemReport = 4;
  constexpr std::int64_t kTimeout = 1500;
  if (!TelephonyUtilIsInternalBuild() && !TelephonyUtilIsCarrierBuild()) return {};
  const auto client = zub::HelperClient::create("logdump.helper", nullptr);
  if (!client) return {};
  const lumo::dict parameters = {{zub::helper::kKeyTimeout, kTimeout}};
  lumo::object reply = lumo::dict();
  const auto result =
      client->perform(kSystemReport, zub::helper::kCommandSysreportStatus, parameters, &reply);
  if (result.code != 0) return {};
  return lumo::dyn_cast_or_default(reply.get(zub::helper::kKeyTimestampString), "");
}

void PrintServerSuccess(const lumo::object& reply, CompressionMode mode, bool qdss) {
  PrintLine("Baseband log collection: Success (ZUB running)");
  const auto timestamp = lumo::dyn_cast_or_default(reply.get(zub::kKeyTimestampString), "");
  PrintLine("Path = " + buildLogPath(timestamp, mode, zub::trace::getBasebandTraceDirSuffix(qdss)));
}

/// Without a server the logs are not packaged: they are in a snapshot folder, or still in the
/// scratch folder of the trace.
void PrintHelperSuccess(bool qdss) {
  const auto timestamp = AskHelperForTimestamp();
  PrintLine("Baseband log collection: Success (ZUB not running)");
  if (timestamp.empty()) {
    PrintLine(std::string("Path = ") + zub::trace::kScratchFolder +
              (qdss ? diag::config::kQDSSScratchDir : diag::config::kDIAGScratchDir));
  } else {
    PrintLine("Path = " + buildLogPath(timestamp, CompressionMode::none,
                                       zub::trace::getBasebandTraceDirSuffix(qdss)));
  }
}

bool Collect(const LogdumpCommand& node, const std::list<std::string>& words) {
  constexpr auto kFailed = "Baseband log collection: Failed";
  const lumo::dict query = {{zub::kKeyTraceName, zub::kTraceBaseband},
                            {zub::kKeyTracePropertyName, zub::kKeyTraceEnabled}};
  lumo::object property;
  const auto asked =
      zub::client::PerformCommand(node.manager, zub::kCommandGetTraceProperty, query, &property);
  if (asked.code != 0 || !property.isDict()) {
    PrintLine(kFailed);
    return asked.code == 0;
  }
  bool enabled = false;
  ReadFlag(property, enabled);
  if (!enabled) {
    PrintLine("Baseband logs are not enabled");
    return true;
  }
  const bool qdss = IsHighThroughputOn(node.manager, query);
  CompressionMode mode{};
  const auto request = DumpRequest(node, words, mode);
  lumo::object dump;
  const auto dumped =
      zub::client::PerformCommand(node.manager, zub::kCommandTraceDumpState, request, &dump);
  if (dumped.code == 0) {
    PrintServerSuccess(dump, mode, qdss);
  } else if (dumped.code == zub::kResultServerNotRunning) {
    PrintHelperSuccess(qdss);
  } else {
    PrintLine(kFailed);
  }
  return true;
}

}  // namespace

CommandHandler LogdumpCommand::basebandLogs() const {
  return [this](const dispatch::group&, const std::list<std::string>& words) {
    return Collect(*this, words);
  };
}
