#include "tool/ZUBCommand.h"

#include "logdump/LogdumpCommand.h"

std::shared_ptr<CommandBase> ZUBCommand::create(const std::string& commandName,
                                                std::weak_ptr<CommandBase> parentCommand,
                                                std::shared_ptr<zub::client::Manager> serverManager,
                                                dispatch::queue toolQueue) {
  std::shared_ptr<CommandBase> node(new ZUBCommand(commandName, std::move(parentCommand),
                                                   std::move(serverManager), std::move(toolQueue)));
  node->init();
  return node;
}

void ZUBCommand::registerCommands() {
  addSubCommand("logdump", LogdumpCommand::create("logdump", shared_from_this(), manager, queue));
}
