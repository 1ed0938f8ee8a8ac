#include "framework/CommandBase.h"

void CommandBase::init() {
  if (const auto above = parent.lock()) hierarchy = above->hierarchy;
  hierarchy += "/" + name;
  registerCommands();
}

bool CommandBase::isAllowed(std::string /*name*/) { return true; }

void CommandBase::addCommandHandler(const std::string& name, CommandHandler handler,
                                    const std::string& helpText, const std::string& note) {
  if (!handler) return;
  commandHandlers[name] = std::move(handler);
  if (!helpText.empty()) commandHelp[name] = helpText;
  commandNotes[name] = note;
}

void CommandBase::addSubCommand(const std::string& name, std::shared_ptr<CommandBase> child) {
  subCommands[name] = std::move(child);
}

bool CommandBase::isValidCommand(const std::string& name) const {
  return commandHandlers.contains(name);
}

bool CommandBase::isValidSubCommand(const std::string& name) const {
  return subCommands.contains(name);
}

std::shared_ptr<CommandBase> CommandBase::getSubCommandObj(const std::string& name) const {
  const auto found = subCommands.find(name);
  return found != subCommands.end() ? found->second : nullptr;
}

std::shared_ptr<CommandBase> CommandBase::getNodeAt(const std::string& element) {
  if (auto child = getSubCommandObj(element)) return child;
  if (element != "..") return nullptr;
  const auto above = parent.lock();
  return above ? above : shared_from_this();
}

std::string CommandBase::helpOf(const std::string& handler) const {
  const auto found = commandHelp.find(handler);
  return found != commandHelp.end() ? found->second : "...";
}

bool CommandBase::execCommand(const std::string& name, const std::list<std::string>& words) const {
  const auto found = commandHandlers.find(name);
  if (found == commandHandlers.end()) return false;
  const auto group = dispatch::group::create();
  if (!group) return false;  // nothing would wait for the handler's work
  // A reference of its own: the handler may register another one in its place.
  const auto handler = found->second;
  const bool succeeded = handler(group, words);
  group.wait();
  return succeeded;
}
