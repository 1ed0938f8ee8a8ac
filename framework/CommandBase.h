#pragma once

#include <list>
#include <map>
#include <memory>
#include <string>

#include "platform/dispatch.h"

/// Runs one named action of a command node.
///
/// Takes the task group of its run and the words after its name, a word list (see WordList.h) of
/// its own. Returns true on success, or when the work was started and completes through the group;
/// false on failure. It runs on the shell thread, any number of times. Work that goes on after it
/// has returned holds a membership of the group until it has ended, in success, failure or
/// time-out alike.
using CommandHandler = dispatch::block<bool(dispatch::group, std::list<std::string>)>;

/// One node of the command tree: a command word with its handlers and its sub-commands.
///
/// A concrete command derives from it, fills its tables in `registerCommands`, and offers a static
/// `create` that takes the new node into a shared pointer, calls `init` on it and returns it. The
/// order matters: the children that `registerCommands` makes refer to this node weakly, which
/// needs an owner.
///
/// Ownership: a parent owns its children; a child refers to its parent weakly.
/// Threads: the shell thread alone. The tables do not change after `init`; there are no locks.
class CommandBase : public std::enable_shared_from_this<CommandBase> {
 public:
  CommandBase(const CommandBase&) = delete;
  CommandBase& operator=(const CommandBase&) = delete;
  virtual ~CommandBase() = default;

  /// Completes the path of names and calls `registerCommands`. Called once, by `create`.
  virtual void init();

  /// Prints the handlers with their help, the trees of the sub-commands and the shell's own words
  /// to standard output, each line flushed at once. The format set on std::cout has no effect.
  virtual void displayHelp();

  /// Whether the shell may run the handler, or enter the sub-command, called `name`. An override
  /// that refuses says why before it returns false.
  virtual bool isAllowed(std::string name);

  /// Registers `handler` under `name`, in place of an earlier one. `note` is what a list of
  /// completions says of it. An empty handler is ignored, with its texts; an empty text leaves an
  /// earlier one as it was.
  void addCommandHandler(const std::string& name, CommandHandler handler,
                         const std::string& helpText, const std::string& note = "");

  /// Registers `child`, which must not be empty, under `name`, in place of an earlier one.
  void addSubCommand(const std::string& name, std::shared_ptr<CommandBase> child);

  bool isValidCommand(const std::string& name) const;
  bool isValidSubCommand(const std::string& name) const;

  /// The child registered under `name`, or an empty pointer.
  std::shared_ptr<CommandBase> getSubCommandObj(const std::string& name) const;

  /// Where `element` of a "cd" path leads: to the child registered under it; for "..", to the node
  /// one level up, or this one where there is none. Empty when it leads nowhere.
  std::shared_ptr<CommandBase> getNodeAt(const std::string& element);

  /// What may stand in place of the last word of a line, each with its note, most without one.
  using Candidates = std::map<std::string, std::string>;

  /// The candidates for the last word of `typed`, a line up to its cursor, where the prompt stands
  /// at this node. That word is empty where `typed` ends in white space; each candidate starts with
  /// it, but for the case of ASCII letters where case has no meaning. One that ends in "/" may go
  /// on.
  ///
  /// It offers what the shell would look up there: sub-commands, handlers and the shell's own
  /// words, and paths after "cd". After a handler it goes by the handler's help text: a bracket of
  /// one word, "[tar|zip]", holds option words, which are read in any case; one of several words,
  /// "[output file path]", stands for a word of its own before all options, and where it ends in
  /// "file path" files are offered; "-p" in front of the description is an option that takes words.
  /// "--" is offered among options. Where nothing is expected, or anything, it offers nothing.
  ///
  /// It asks no node for permission and runs nothing; of the system it reads folders alone.
  Candidates complete(const std::string& typed);

  /// Runs the handler called `name` on this thread and returns its result, once all the work that
  /// it put on its task group has ended; there is no time-out. Without such a handler, or without
  /// the memory for a group, it does nothing and returns false.
  [[nodiscard]] bool execCommand(const std::string& name,
                                 const std::list<std::string>& words) const;

  /// The path of names from the root, each after a "/"; empty before `init`.
  std::string getHierarchy() const { return hierarchy; }

  /// The node one level up; empty for the root.
  std::weak_ptr<CommandBase> getParent() const { return parent; }

 protected:
  CommandBase(std::string name, std::weak_ptr<CommandBase> parent)
      : parent(std::move(parent)), name(std::move(name)) {}

  /// Adds this node's handlers and sub-commands, with `addCommandHandler` and `addSubCommand`.
  virtual void registerCommands() = 0;

 private:
  static void printCommandTree(const std::shared_ptr<CommandBase>& node, int depth);
  std::string helpOf(const std::string& handler) const;
  Candidates completeName(const std::string& start, bool isFirst) const;
  Candidates completePath(const std::string& start);

  const std::weak_ptr<CommandBase> parent;
  const std::string name;
  std::string hierarchy;
  std::map<std::string, CommandHandler> commandHandlers;
  std::map<std::string, std::string> commandHelp;  // only for handlers that have a help text
  std::map<std::string, std::shared_ptr<CommandBase>> subCommands;
  std::map<std::string, std::string> commandNotes;  // only for handlers that have a note
};
