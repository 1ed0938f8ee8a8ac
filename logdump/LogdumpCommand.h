#pragma once

#include "tool/ZUBCommandBase.h"

/// Printed on standard error when a handler is refused.
inline constexpr auto kServerDownErrorPrint =
    "Server is not running. Please try after server starts.";

/// The command `logdump`: the handlers `tel`, `core`, `bb` and `oslog`, which collect logs.
class LogdumpCommand : public ZUBCommandBase {
 public:
  /// Returns a new node with its handlers.
  static std::shared_ptr<CommandBase> create(const std::string& name,
                                             std::weak_ptr<CommandBase> parent,
                                             std::shared_ptr<zub::client::Manager> manager,
                                             dispatch::queue queue);

  /// Refuses every name but `bb` while the server is not running.
  bool isAllowed(std::string name) override;

  /// Asks the server whether its system-logs trace is in lite mode and waits for the answer.
  /// Returns false if there is no usable answer.
  bool isSystemLogsTraceLite() const;

 private:
  using ZUBCommandBase::ZUBCommandBase;
  void registerCommands() override;

  /// The handler that asks the server to collect telephony logs. It sends the request and returns
  /// true. When the reply arrives, it prints the outcome and, on success, the path, and leaves its
  /// task group.
  CommandHandler telephonyLogs() const;

  /// The same with a core dump of the modem, which resets the baseband.
  CommandHandler telephonyLogsWithCoredump() const;

  /// The handler that asks the server to dump the baseband trace logs or, if no server runs, asks
  /// the helper service where they are. Its requests are synchronous; it does not use its task
  /// group. It returns false only if the query whether the trace is enabled fails; other failures
  /// are printed.
  CommandHandler basebandLogs() const;
};
