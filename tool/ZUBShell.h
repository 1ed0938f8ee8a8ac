#pragma once

#include "framework/CommandShell.h"

/// The tool's shell. Making its root command connects the tool to the baseband manager server.
class ZUBShell : public CommandShell {
 public:
  using CommandShell::CommandShell;

 protected:
  /// Makes the tool queue and the manager, follows the server's state (see ServerState.h), gives
  /// the server half a second to report it, and builds the tree under the program's invocation
  /// name, whether a server runs or not. Empty, and why on standard error, when the system has no
  /// thread for the queue.
  std::shared_ptr<CommandBase> createRootCommand() override;
};
