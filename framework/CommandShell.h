#pragma once

#include <functional>
#include <list>
#include <memory>
#include <optional>
#include <string>

#include "framework/CommandBase.h"

/// Runs a command tree for a user: the words of a command line once, or lines typed at a prompt
/// that names the node where it stands.
///
/// A subclass supplies the tree. It reads std::cin and writes to std::cout, but for lines that the
/// reader it was given has a person edit. Threads: one, on which every handler runs as well.
class CommandShell {
 public:
  /// As `CommandBase::complete`, of the node where the prompt stands.
  using Completer = std::function<CommandBase::Candidates(const std::string& typed)>;

  /// Shows `prompt` and has a person edit a line, which it leaves, without its line end, in the
  /// empty `line`. True for a line; false when the input has ended; nothing, with nothing shown or
  /// read, where no line can be edited.
  using LineReader = std::function<std::optional<bool>(
      const std::string& prompt, const Completer& complete, std::string& line)>;

  CommandShell() = default;

  /// Reads lines with `readEdited`, which may be empty, and from std::cin where that can edit none.
  explicit CommandShell(LineReader readEdited) : readEdited(std::move(readEdited)) {}

  CommandShell(const CommandShell&) = delete;
  CommandShell& operator=(const CommandShell&) = delete;
  virtual ~CommandShell() = default;

  /// All `argc` arguments as a word list (see WordList.h), the program's name at its back.
  static std::list<std::string> convertCmdArgsToList(int argc, const char* const* argv);

  /// Runs the command line `words`, the program's name at its back; called once. Without further
  /// words it prompts and runs line after line. Returns true when every command group of the
  /// command line succeeded, or "quit" or "exit" was typed; false when one failed, no tree could
  /// be made, or no further line could be read.
  [[nodiscard]] bool run(std::list<std::string> words);

 protected:
  /// Builds the tree and returns its root, or an empty pointer when it cannot be made. Called once,
  /// first of all, by `run`.
  virtual std::shared_ptr<CommandBase> createRootCommand() = 0;

 private:
  /// How a command group, or a batch of them, ended.
  enum class Outcome { succeeded, failed, quit };

  Outcome runLines();
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
};
