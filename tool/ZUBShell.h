#pragma once

#include "framework/CommandShell.h"

/// The tool's shell. Making its root command connects the tool to the baseband manager server.
class ZUBShell : public CommandShell {
 protected:
  /// Makes the tool queue and the manager, follows the server's state (see ServerState.h), gives
  /// the server half a second to report it, and builds the tree under the program's invocation
  /// name. Never empty; whether a server runs makes no difference.
  std::shared_ptr<CommandBase> createRootCommand() override;
};
