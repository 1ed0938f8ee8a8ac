#pragma once

#include "tool/ZUBCommandBase.h"

/// The root of the tool's command tree. It has one sub-command, `logdump`, and allows everything.
class ZUBCommand : public ZUBCommandBase {
 public:
  /// Makes the root and the tree below it.
  static std::shared_ptr<CommandBase> create(const std::string& name,
                                             std::weak_ptr<CommandBase> parent,
                                             std::shared_ptr<zub::client::Manager> manager,
                                             dispatch::queue queue);

 private:
  using ZUBCommandBase::ZUBCommandBase;
  void registerCommands() override;
};
