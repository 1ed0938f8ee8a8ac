#include <iomanip>
#include <iostream>

#include "framework/CommandBase.h"

namespace {

constexpr int kNameWidth = 16;
constexpr auto kSeparator = "  -  ";
constexpr auto kGreen = "\033[32m";
constexpr auto kDefaultColour = "\033[39m";

/// Starts a line of the listing: a tab and `word`, right-justified.
std::ostream& StartLine(const std::string& word) {
  return std::cout << '\t' << std::setw(kNameWidth) << word;
}

/// The names of a node's handlers, as "[bb|core]".
std::string Summarize(const std::map<std::string, CommandHandler>& handlers) {
  std::string summary = "[";
  for (const auto& [name, handler] : handlers) summary += name + "|";
  summary.back() = ']';
  return summary;
}

}  // namespace

// std::endl throughout: each line is to be seen at once, through a pipe as well.

void CommandBase::displayHelp() {
  std::cout << std::endl;
  std::cout << "Options for command '" << kGreen << name << kDefaultColour << "':" << std::endl;
  std::cout << std::endl;
  for (const auto& [handler, callable] : commandHandlers) {
    StartLine(handler) << kSeparator << helpOf(handler) << std::endl;
    std::cout << std::endl;
  }
  for (const auto& [word, child] : subCommands) {
    printCommandTree(child, 0);
    std::cout << std::endl;
  }
  StartLine("cd") << kSeparator << "<sub-command>" << std::endl;
  for (const auto* const word : {"help", "back", "quit"}) StartLine(word) << std::endl;
  std::cout << std::endl;
}

void CommandBase::printCommandTree(const std::shared_ptr<CommandBase>& node, int depth) {
  if (!node->commandHandlers.empty()) {
    if (depth == 0) {
      StartLine(node->name);
    } else {
      std::cout << '\t' << std::string(static_cast<std::size_t>(depth) * kNameWidth, ' ')
                << "     <" << node->name << '>';
    }
    std::cout << kSeparator << Summarize(node->commandHandlers) << std::endl;
  }
  for (const auto& [word, child] : node->subCommands) printCommandTree(child, depth + 1);
}
