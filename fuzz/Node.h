#pragma once

#include <iostream>
#include <list>
#include <memory>
#include <sstream>
#include <string>

#include "framework/CommandBase.h"
#include "framework/WordList.h"

/// A node that says on standard output what is asked of it: "?name" for permission, which it
/// refuses for names with "no" in front, and "path:handler(words)" for a run.
class Node : public CommandBase {
 public:
  static std::shared_ptr<Node> create(const std::string& word, std::weak_ptr<CommandBase> above) {
    std::shared_ptr<Node> node(new Node(word, std::move(above)));
    node->init();
    return node;
  }

  bool isAllowed(std::string word) override {
    std::cout << "?" << word << ' ';
    return !word.starts_with("no");
  }
  void displayHelp() override { std::cout << "help " << getHierarchy() << ' '; }
  void handler(const std::string& word, bool result = true, const std::string& help = "",
               const std::string& note = "") {
    const auto run = [this, word, result](const dispatch::group&, std::list<std::string> words) {
      std::cout << getHierarchy() << ':' << word << '(';
      while (!words.empty()) std::cout << '<' << TakeNextWord(words) << '>';
      std::cout << ") ";
      return result;
    };
    addCommandHandler(word, run, help, note);
  }

  /// Adds the handlers of a list of paths, and the sub-commands on their way.
  void add(const std::string& paths) {
    std::istringstream list(paths);
    for (std::string path; list >> path;) {
      const auto slash = path.find('/');
      const auto word = path.substr(0, slash);
      if (slash == std::string::npos) {
        handler(word);
        continue;
      }
      if (!isValidSubCommand(word)) addSubCommand(word, create(word, weak_from_this()));
      std::static_pointer_cast<Node>(getSubCommandObj(word))->add(path.substr(slash + 1));
    }
  }

 private:
  using CommandBase::CommandBase;
  void registerCommands() override {}
};
