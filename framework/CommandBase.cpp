#include "framework/CommandBase.h"

void CommandBase::init() {
  const auto above = parent.lock();
  if (above) hierarchy = above->hierarchy;
  hierarchy += "/" + name;
  registerCommands();
}

bool CommandBase::isAllowed(std::string /*name*/) { return true; }

void CommandBase::addCommandHandler(const std::string& handlerName, CommandHandler handler,
                                    const std::string& helpText) {
  if (!handler) return;
  commandHandlers[handlerName] = std::move(handler);
  if (!helpText.empty()) commandHelp[handlerName] = helpText;
}

void CommandBase::addSubCommand(const std::string& childName, std::shared_ptr<CommandBase> child) {
  subCommands[childName] = std::move(child);
}

bool CommandBase::isValidCommand(const std::string& word) const {
  return commandHandlers.contains(word);
}

bool CommandBase::isValidSubCommand(const std::string& word) const {
  return subCommands.contains(word);
}

std::shared_ptr<CommandBase> CommandBase::getSubCommandObj(const std::string& word) const {
  const auto found = subCommands.find(word);
  return found != subCommands.end() ? found->second : nullptr;
}

bool CommandBase::execCommand(const std::string& word, const std::list<std::string>& words) const {
  const auto found = commandHandlers.find(word);
  if (found == commandHandlers.end()) return false;
  const auto group = dispatch::group::create();
  if (!group) return false;  // work on no group could not be waited for
  const bool succeeded = found->second(group, words);
  group.wait();
  return succeeded;
}
