#include "logdump/LogdumpCommand.h"

#include <iostream>

#include "logdump/OsLogCommand.h"
#include "logdump/TraceProperty.h"
#include "tool/ServerState.h"

std::shared_ptr<CommandBase> LogdumpCommand::create(const std::string& name,
                                                    std::weak_ptr<CommandBase> parent,
                                                    std::shared_ptr<zub::client::Manager> manager,
                                                    dispatch::queue queue) {
  std::shared_ptr<CommandBase> node(
      new LogdumpCommand(name, std::move(parent), std::move(manager), std::move(queue)));
  node->init();
  return node;
}

bool LogdumpCommand::isAllowed(std::string name) {
  if (name == "bb") return true;  // the helper service stands in for the server
  if (IsServerRunning()) return true;
  std::cerr << kServerDownErrorPrint << std::endl;
  return false;
}

void LogdumpCommand::registerCommands() {
  addCommandHandler("tel", telephonyLogs(),
                    "[nocompress|tar.gz|tar] [nonui] <reason> collect telephony logs");
  addCommandHandler("core", telephonyLogsWithCoredump(),
                    "[nocompress|tar.gz|tar] [nonui] <reason> collect telephony logs with coredump",
                    "resets the baseband");
  addCommandHandler("bb", basebandLogs(),
                    "[nocompress|tar.gz|tar] <reason> collect baseband logs only");
  addCommandHandler("oslog", OsLogHandler(),
                    "[history size] [output txt file path] -p <process1 process2..> -i "
                    "<imagePath1 imagePath2..> collect oslog to txt");
}

bool LogdumpCommand::isSystemLogsTraceLite() const {
  constexpr std::int32_t kLite = 2;
  const lumo::dict request = {{zub::kKeyTraceName, zub::kTraceSystemLogs},
                              {zub::kKeyTracePropertyName, zub::kKeyTraceMode}};
  lumo::object reply;
  zub::client::PerformCommand(manager, zub::kCommandGetTraceProperty, request, &reply);
  return ParseTraceMode(lumo::dyn_cast_or_default(reply.get(zub::kKeyTracePropertyValue), "")) ==
         kLite;
}
