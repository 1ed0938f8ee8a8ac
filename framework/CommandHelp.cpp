#include <algorithm>
#include <iostream>

#include "framework/CommandBase.h"

namespace {

constexpr std::size_t kNameWidth = 16;
constexpr auto kSeparator = "  -  ";

/// Prints and flushes `line`. Unformatted output neither uses nor changes the width, fill and flags
/// of std::cout.
void PrintLine(const std::string& line) {
  std::cout.write(line.data(), static_cast<std::streamsize>(line.size())) << std::endl;
}

/// The start of a line of the listing: a tab and `word`, right-justified.
std::string Justified(const std::string& word) {
  return '\t' + std::string(kNameWidth - std::min(word.size(), kNameWidth), ' ') + word;
}

/// The names of a node's handlers, as "[bb|core]".
std::string Summarize(const std::map<std::string, CommandHandler>& handlers) {
  std::string summary = "[";
  for (const auto& [name, handler] : handlers) summary += name + "|";
  summary.back() = ']';
  return summary;
}

}  // namespace

void CommandBase::displayHelp() {
  PrintLine("");
  PrintLine("Options for command '\033[32m" + name + "\033[39m':");
  PrintLine("");
  for (const auto& [handler, callable] : commandHandlers) {
    PrintLine(Justified(handler) + kSeparator + helpOf(handler));
    PrintLine("");
  }
  for (const auto& [word, child] : subCommands) {
    printCommandTree(child, 0);
    PrintLine("");
  }
  PrintLine(Justified("cd") + kSeparator + "<sub-command>");
  for (const auto* const word : {"help", "back", "quit"}) PrintLine(Justified(word));
  PrintLine("");
}

void CommandBase::printCommandTree(const std::shared_ptr<CommandBase>& node, int depth) {
  if (!node->commandHandlers.empty()) {
    const auto indent = std::string(static_cast<std::size_t>(depth) * kNameWidth, ' ');
    const auto label =
        depth == 0 ? Justified(node->name) : '\t' + indent + "     <" + node->name + '>';
    PrintLine(label + kSeparator + Summarize(node->commandHandlers));
  }
  for (const auto& [word, child] : node->subCommands) printCommandTree(child, depth + 1);
}
