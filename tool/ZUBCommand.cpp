#include "tool/ZUBCommand.h"

#include "logdump/LogdumpCommand.h"

std::shared_ptr<CommandBase> ZUBCommand::create(const std::string& name,
                                                std::weak_ptr<CommandBase> parent,
                                                std::shared_ptr<zub::client::Manager> manager,
                                                dispatch::queue queue) {
  std::shared_ptr<CommandBase> node(
      new ZUBCommand(name, std::move(parent), std::move(manager), std::move(queue)));
  node->init();
  return node;
}

void ZUBCommand::registerCommands() {
  addSubCommand("logdump", LogdumpCommand::create("logdump", shared_from_this(), manager, queue));
}
