#pragma once

#include "framework/CommandShell.h"

/// The tool's shell. It connects to the baseband manager server when it makes its root command.
class ZUBShell : public CommandShell {
 public:
  using CommandShell::CommandShell;

 protected:
  /// Makes the tool queue and the manager, subscribes to the server's state (see ServerState.h),
  /// waits half a second for it, and builds the tree, whether a server runs or not. The root is
  /// named after the program's invocation name. Returns an empty pointer, and prints the reason on
  /// standard error, if the system has no thread for the queue.
  std::shared_ptr<CommandBase> createRootCommand() override;
};
