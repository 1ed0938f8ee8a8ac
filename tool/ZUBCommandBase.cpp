#include "tool/ZUBCommandBase.h"

ZUBCommandBase::ZUBCommandBase(const std::string& commandName,
                               std::weak_ptr<CommandBase> parentCommand,
                               std::shared_ptr<zub::client::Manager> serverManager,
                               dispatch::queue toolQueue)
    : CommandBase(commandName, std::move(parentCommand)),
      manager(std::move(serverManager)),
      queue(std::move(toolQueue)) {}

ZUBCommandBase::~ZUBCommandBase() = default;
