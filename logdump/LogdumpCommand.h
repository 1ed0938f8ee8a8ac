#pragma once

#include "tool/ZUBCommandBase.h"

/// What a refused handler prints on standard error.
inline constexpr auto kServerDownErrorPrint =
    "Server is not running. Please try after server starts.";

/// The command `logdump`: the handlers `tel`, `core`, `bb` and `oslog`, which collect logs.
class LogdumpCommand : public ZUBCommandBase {
 public:
  /// Makes the node with its handlers.
  static std::shared_ptr<CommandBase> create(const std::string& name,
                                             std::weak_ptr<CommandBase> parent,
                                             std::shared_ptr<zub::client::Manager> manager,
                                             dispatch::queue queue);

  /// Refuses all handlers but `bb` while the server is not running.
  bool isAllowed(std::string name) override;

  /// Asks the server whether its system-logs trace runs in lite mode, and blocks until it has
  /// answered. No usable answer counts as no.
  bool isSystemLogsTraceLite() const;

 private:
  using ZUBCommandBase::ZUBCommandBase;
  void registerCommands() override;
};
