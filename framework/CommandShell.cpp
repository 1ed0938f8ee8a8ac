#include "framework/CommandShell.h"

#include <iostream>

#include "framework/WordList.h"

std::list<std::string> CommandShell::convertCmdArgsToList(int argc, const char* const* argv) {
  std::list<std::string> words;
  for (int i = 0; i < argc; ++i) words.emplace_front(argv[i]);
  return words;
}

bool CommandShell::run(std::list<std::string> words) {
  rootCommand = createRootCommand();
  if (!rootCommand) return false;
  if (!words.empty()) words.pop_back();
  if (!words.empty()) return runBatch(words) != Outcome::failed;
  promptCommand = rootCommand;
  for (std::string line; readLine(line);) {
    if (runBatch(convertLineToList(line)) == Outcome::quit) return true;
  }
  return false;
}

/// Prompts and reads a line. False if there is none.
bool CommandShell::readLine(std::string& line) const {
  const auto prompt = '(' + promptCommand->getHierarchy() + ")>> ";
  if (readEdited) {
    std::cout << std::flush;
    const auto complete = [this](const std::string& typed) {
      return promptCommand->complete(typed);
    };
    if (const auto isLine = readEdited(prompt, complete, line)) return *isLine;
  }
  std::cout << prompt << std::flush;
  return static_cast<bool>(std::getline(std::cin, line));
}

/// Runs the groups of `words` until one does not succeed.
CommandShell::Outcome CommandShell::runBatch(const std::list<std::string>& words) {
  for (auto& group : splitCmdList(words)) {
    currentCommand = promptCommand ? promptCommand : rootCommand;
    const auto outcome = runGroup(std::move(group));
    if (outcome != Outcome::succeeded) return outcome;
  }
  return Outcome::succeeded;
}

/// Resolves the words of one group in turn. Handlers come before sub-commands, and both before the
/// shell's own words except "cd".
CommandShell::Outcome CommandShell::runGroup(std::list<std::string> words) {
  const bool isOneWord = words.size() == 1;
  for (;;) {
    const auto word = TakeNextWord(words);
    if (word == "cd") return changeDirectory(words);
    if (currentCommand->isValidCommand(word)) {
      if (!currentCommand->isAllowed(word)) return Outcome::failed;
      const auto shown = showWork ? showWork() : nullptr;
      const bool succeeded = currentCommand->execCommand(word, words);
      return succeeded ? Outcome::succeeded : Outcome::failed;
    }
    if (!currentCommand->isValidSubCommand(word)) {
      return runShellWord(word, words.empty(), isOneWord);
    }
    if (!currentCommand->isAllowed(word)) return Outcome::failed;
    currentCommand = currentCommand->getSubCommandObj(word);
    if (words.empty()) {  // a sub-command alone does nothing: show what it offers
      currentCommand->displayHelp();
      return Outcome::failed;
    }
  }
}

CommandShell::Outcome CommandShell::runShellWord(const std::string& word, bool isLast,
                                                 bool isWholeGroup) {
  if (isLast && word == "help") {
    currentCommand->displayHelp();
    return Outcome::succeeded;
  }
  if (isWholeGroup && word == "back") {
    const auto above = promptCommand ? promptCommand->getParent().lock() : nullptr;
    if (above) promptCommand = above;
    return Outcome::succeeded;
  }
  if (isWholeGroup && (word == "quit" || word == "exit")) return Outcome::quit;
  // The help that follows starts with a line end, which ends this line too.
  std::cout << std::endl << "Invalid command option '\033[31m" << word << "\033[39m'";
  currentCommand->displayHelp();
  return Outcome::failed;
}

CommandShell::Outcome CommandShell::changeDirectory(const std::list<std::string>& words) {
  if (words.size() != 1 || !followPath(words.back())) {
    currentCommand->displayHelp();
    return Outcome::failed;
  }
  if (promptCommand) promptCommand = currentCommand;
  return Outcome::succeeded;
}

/// Moves the current node along `path`; false at the first element that leads nowhere. No node is
/// asked for permission, because nothing runs.
bool CommandShell::followPath(const std::string& path) {
  for (const auto& element : splitCmdPath(path)) {
    auto next = currentCommand->getNodeAt(element);
    if (!next) return false;
    currentCommand = std::move(next);
  }
  return true;
}
