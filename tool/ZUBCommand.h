#pragma once

#include "tool/ZUBCommandBase.h"

/// The root of the tool's command tree. Its only sub-command is `logdump`.
class ZUBCommand : public ZUBCommandBase {
 public:
  /// Returns a new root with its whole tree.
  static std::shared_ptr<CommandBase> create(const std::string& name,
                                             std::weak_ptr<CommandBase> parent,
                                             std::shared_ptr<zub::client::Manager> manager,
                                             dispatch::queue queue);

 private:
  using ZUBCommandBase::ZUBCommandBase;
  void registerCommands() override;
};
