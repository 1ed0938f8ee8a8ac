#pragma once

#include <list>
#include <map>
#include <memory>
#include <string>

#include "platform/dispatch.h"

/// Runs one named action of a command node.
///
/// Takes the task group of its run and its own copy of the words after its name, a word list (see
/// WordList.h). Returns true on success, or when it has started work that completes through the
/// group; false on failure. Called on the shell thread, any number of times. Work that outlives the
/// call holds a membership of the group until it ends, whether it succeeds, fails or times out.
using CommandHandler = dispatch::block<bool(dispatch::group, std::list<std::string>)>;

/// One node of the command tree: a command word with its handlers and its sub-commands.
///
/// A concrete command derives from it, fills its tables in `registerCommands`, and has a static
/// `create` that puts a new node into a shared pointer, calls `init` and returns it, in this order:
/// the children that `registerCommands` makes take a weak reference to the node, which needs an
/// owner.
///
/// Ownership: a parent owns its children; a child refers to its parent weakly.
/// Threads: the shell thread only. The tables do not change after `init`.
class CommandBase : public std::enable_shared_from_this<CommandBase> {
 public:
  CommandBase(const CommandBase&) = delete;
  CommandBase& operator=(const CommandBase&) = delete;
  virtual ~CommandBase() = default;

  /// Sets the hierarchy and calls `registerCommands`. Called once, by `create`.
  virtual void init();

  /// Prints the handlers with their help, the trees of the sub-commands and the shell's own words
  /// to std::cout, whose format has no effect on them, and flushes each line.
  virtual void displayHelp();

  /// Whether the shell may run the handler or enter the sub-command `name`. An override that
  /// refuses prints the reason.
  virtual bool isAllowed(std::string name);

  /// Registers `handler` under `name`; it replaces an earlier one. A list of completions shows
  /// `note` beside the name. An empty handler is ignored together with its texts. An empty help
  /// text leaves an earlier one in place.
  void addCommandHandler(const std::string& name, CommandHandler handler,
                         const std::string& helpText, const std::string& note = "");

  /// Registers `child`, which must not be empty, under `name`; it replaces an earlier one.
  void addSubCommand(const std::string& name, std::shared_ptr<CommandBase> child);

  bool isValidCommand(const std::string& name) const;
  bool isValidSubCommand(const std::string& name) const;

  /// The child registered under `name`, or an empty pointer.
  std::shared_ptr<CommandBase> getSubCommandObj(const std::string& name) const;

  /// The node to which `element` of a "cd" path leads from here: the child of that name, or for
  /// ".." the parent, or this node if it has none. Empty when the element leads nowhere.
  std::shared_ptr<CommandBase> getNodeAt(const std::string& element);

  /// Words that may replace the last word of a line, each with a note, which may be empty.
  using Candidates = std::map<std::string, std::string>;

  /// Completes the last word of `typed`, a line up to its cursor, for a prompt at this node. The
  /// word is empty if `typed` ends in white space. Every candidate starts with it, except that the
  /// case of option words does not matter. A candidate that ends in "/" can be continued.
  ///
  /// The candidates are what the shell would look up: sub-commands, handlers, its own words, and
  /// paths after "cd". After a handler, they follow from its help text. A bracket with one word,
  /// "[tar|zip]", lists option words. A bracket with several, "[output file path]", is an argument
  /// that comes before all options; files are offered for one that ends in "file path". A word
  /// like "-p" in front of the description is an option that takes arguments. "--" is offered
  /// where options are. Where no word is expected, or any word is, there are no candidates.
  ///
  /// Calls no handler and not `isAllowed`. Reads folders, but no other part of the system.
  Candidates complete(const std::string& typed);

  /// Runs the handler `name` on this thread, waits without a time-out until its task group is
  /// empty, and returns the handler's result. Does nothing and returns false if there is no such
  /// handler or no memory for a group.
  [[nodiscard]] bool execCommand(const std::string& name,
                                 const std::list<std::string>& words) const;

  /// The names from the root to this node, each preceded by "/"; empty before `init`.
  std::string getHierarchy() const { return hierarchy; }

  /// The parent; empty for the root.
  std::weak_ptr<CommandBase> getParent() const { return parent; }

 protected:
  CommandBase(std::string name, std::weak_ptr<CommandBase> parent)
      : parent(std::move(parent)), name(std::move(name)) {}

  /// Registers the handlers and sub-commands of this node.
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
  Candidates commandNotes;  // of all handlers
};
