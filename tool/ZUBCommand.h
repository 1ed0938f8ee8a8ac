#pragma once

#include "tool/ZUBCommandBase.h"

/// The root of the tool's command tree. It has one sub-command, `logdump`, and allows everything.
class ZUBCommand : public ZUBCommandBase {
 public:
  /// Makes the root and the whole tree below it. Threads: the shell thread.
  static std::shared_ptr<CommandBase> create(const std::string& commandName,
                                             std::weak_ptr<CommandBase> parentCommand,
                                             std::shared_ptr<zub::client::Manager> serverManager,
                                             dispatch::queue toolQueue);

 private:
  using ZUBCommandBase::ZUBCommandBase;
  void registerCommands() override;
};
