#pragma once

#include <functional>
#include <list>
#include <memory>
#include <optional>
#include <string>

#include "framework/CommandBase.h"

/// Runs a command tree for a user: the words of a command line once, or line after line typed at a
/// prompt, which shows the hierarchy of the current node.
///
/// A subclass supplies the tree. The shell reads std::cin and writes to std::cout; if it is given a
/// reader of edited lines, that reads and prompts instead. Threads: one, which also runs the
/// handlers.
class CommandShell {
 public:
  /// `CommandBase::complete` of the node at which the prompt stands.
  using Completer = std::function<CommandBase::Candidates(const std::string& typed)>;

  /// Shows `prompt`, lets the user edit a line and stores it in `line` without a line end. Returns
  /// true for a line and false at the end of the input; no value, and shows and reads nothing, if
  /// lines cannot be edited here.
  using LineReader = std::function<std::optional<bool>(
      const std::string& prompt, const Completer& complete, std::string& line)>;

  /// Shows that a handler runs until what it returns is released.
  using WorkShower = std::function<std::shared_ptr<void>()>;

  /// Reads lines with `readEdited`, or from std::cin if that is empty or returns no value. Calls
  /// `showWork`, unless it is empty, before each run of a handler.
  explicit CommandShell(LineReader readEdited = {}, WorkShower showWork = {})
      : readEdited(std::move(readEdited)), showWork(std::move(showWork)) {}

  CommandShell(const CommandShell&) = delete;
  CommandShell& operator=(const CommandShell&) = delete;
  virtual ~CommandShell() = default;

  /// The `argc` arguments as a word list (see WordList.h), whose back is the program's name.
  static std::list<std::string> convertCmdArgsToList(int argc, const char* const* argv);

  /// Runs the command line `words`, whose back is the program's name, or prompts for lines if there
  /// are no other words. Returns true when every command group of the command line succeeded, or at
  /// "quit" or "exit"; false when one failed, the tree could not be made, or no line could be read.
  /// Called once.
  [[nodiscard]] bool run(std::list<std::string> words);

 protected:
  /// Builds the tree and returns its root, or an empty pointer if that is not possible. Called
  /// once, at the start of `run`.
  virtual std::shared_ptr<CommandBase> createRootCommand() = 0;

 private:
  /// The end of a command group or of a batch of them.
  enum class Outcome { succeeded, failed, quit };

  bool readLine(std::string& line) const;
  Outcome runBatch(const std::list<std::string>& words);
  Outcome runGroup(std::list<std::string> words);
  Outcome runShellWord(const std::string& word, bool isLast, bool isWholeGroup);
  Outcome changeDirectory(const std::list<std::string>& words);
  bool followPath(const std::string& path);

  std::shared_ptr<CommandBase> rootCommand;
  std::shared_ptr<CommandBase> promptCommand;   // where the prompt stands; empty in a one-shot run
  std::shared_ptr<CommandBase> currentCommand;  // where the next word is looked up
  const LineReader readEdited;
  const WorkShower showWork;
};
