#include <gtest/gtest.h>

#include <functional>
#include <iostream>
#include <sstream>
#include <thread>

#include "framework/CommandShell.h"
#include "framework/WordList.h"

namespace {

using Words = std::list<std::string>;

/// What the program prints on standard output while this lives, a "$" where it flushes.
class CapturedOutput : public std::stringbuf {
 public:
  explicit CapturedOutput(bool marksFlushes = false)
      : marks(marksFlushes), before(std::cout.rdbuf(this)) {}
  ~CapturedOutput() override { std::cout.rdbuf(before); }

 private:
  int sync() override {
    if (marks) sputc('$');
    return 0;
  }
  bool marks;
  std::streambuf* before;
};

/// What the program reads on standard input while this lives.
class TypedInput : public std::stringbuf {
 public:
  explicit TypedInput(const std::string& text)
      : std::stringbuf(text), before(std::cin.rdbuf(this)) {
    std::cin.clear();
  }
  ~TypedInput() override { std::cin.rdbuf(before); }

 private:
  std::streambuf* before;
};

/// A node that says on standard output what is asked of it: "?name" for permission, which it
/// refuses for names with "no" in front, and "path:handler(words)" for a run.
class Node : public CommandBase {
 public:
  using Build = std::function<void(Node&)>;

  static std::shared_ptr<Node> create(const std::string& word, std::weak_ptr<CommandBase> above,
                                      Build build, bool realHelp = false) {
    std::shared_ptr<Node> node(new Node(word, std::move(above)));
    node->build = std::move(build);
    node->realHelp = realHelp;
    node->init();
    return node;
  }

  bool isAllowed(std::string word) override {
    std::cout << "?" << word << ' ';
    return !word.starts_with("no");
  }
  void displayHelp() override {
    if (realHelp) return CommandBase::displayHelp();
    std::cout << "help " << getHierarchy() << ' ';
  }
  void handler(const std::string& word, bool result = true, const std::string& help = "") {
    addCommandHandler(
        word,
        [this, word, result](const dispatch::group&, Words words) {
          std::cout << getHierarchy() << ':' << word << '(';
          while (!words.empty()) std::cout << '<' << takeNextWord(words) << '>';
          std::cout << ") ";
          return result;
        },
        help);
  }
  void child(const std::string& word, Build buildChild) {
    addSubCommand(word, create(word, weak_from_this(), std::move(buildChild), realHelp));
  }

 private:
  using CommandBase::CommandBase;
  void registerCommands() override { build(*this); }
  Build build;
  bool realHelp = false;
};

/// a succeeds, f fails; s is a sub-command with a, the sub-command t below it, and the names of
/// three of the shell's words; both is a handler and a sub-command.
void buildTree(Node& root) {
  root.handler("a");
  root.handler("f", false);
  root.handler("nohandler");
  root.handler("both");
  root.child("both", [](Node&) {});
  root.child("nosub", [](Node& node) { node.handler("a"); });
  root.child("s", [](Node& node) {
    node.handler("a");
    node.handler("cd");
    node.handler("help");
    node.handler("quit");
    node.child("t", [](Node& deep) { deep.handler("a"); });
  });
}

class TestShell : public CommandShell {
 public:
  bool hasTree = true;

 private:
  std::shared_ptr<CommandBase> createRootCommand() override {
    return hasTree ? Node::create("r", {}, buildTree) : nullptr;
  }
};

/// The program's name and `words`, as a word list.
Words commandLine(const std::vector<const char*>& words) {
  std::vector<const char*> arguments = {"r"};
  arguments.insert(arguments.end(), words.begin(), words.end());
  return CommandShell::convertCmdArgsToList(static_cast<int>(arguments.size()), arguments.data());
}

TEST(Shell, OneShot) {
  const struct {
    std::vector<const char*> words;
    std::string output;
    bool result;
  } cases[] = {
      {{"a", "", "x y", "--z"}, "?a /r:a(<><x y><--z>) ", true},
      {{"f"}, "?f /r:f() ", false},
      {{"nohandler", "x"}, "?nohandler ", false},
      {{"nosub", "a"}, "?nosub ", false},
      {{"both", "x"}, "?both /r:both(<x>) ", true},
      {{"s", "t", "a", "help"}, "?s ?t ?a /r/s/t:a(<help>) ", true},
      {{"s"}, "?s help /r/s ", false},
      {{"help"}, "help /r ", true},
      {{"s", "t", "help"}, "?s ?t help /r/s/t ", true},
      {{"s", "help"}, "?s ?help /r/s:help() ", true},
      {{"help", "s"}, "\nInvalid command option '\033[31mhelp\033[39m'help /r ", false},
      {{"A"}, "\nInvalid command option '\033[31mA\033[39m'help /r ", false},
      {{"s", "t", ""}, "?s ?t \nInvalid command option '\033[31m\033[39m'help /r/s/t ", false},
      {{"back"}, "", true},
      {{"s", "t", "back"},
       "?s ?t \nInvalid command option '\033[31mback\033[39m'help /r/s/t ",
       false},
      {{"quit", "now"}, "\nInvalid command option '\033[31mquit\033[39m'help /r ", false},
      {{"s", "quit"}, "?s ?quit /r/s:quit() ", true},
      {{"exit", "--", "f"}, "", true},
      {{"a", "--", "quit", "--", "f"}, "?a /r:a() ", true},
      {{"--"}, "", true},
      {{"--", "s", "a", "--", "--", "a", "---", "--"}, "?s ?a /r/s:a() ?a /r:a(<--->) ", true},
      {{"f", "--", "a"}, "?f /r:f() ", false},
      {{"a", "--", "f", "--", "a"}, "?a /r:a() ?f /r:f() ", false},
      {{"cd", "s", "--", "a"}, "?a /r:a() ", true},
      {{"s", "cd", "t"}, "?s ", true},
      {{"cd", "nosub"}, "", true},
      {{"cd", "s/t/bogus/.."}, "help /r/s/t ", false},
      {{"cd"}, "help /r ", false},
      {{"cd", "s", "t"}, "help /r ", false},
      {{"cd", ""}, "", true},
      {{"cd", " s//t /../.. .."}, "", true},
  };
  for (const auto& [words, output, result] : cases) {
    const CapturedOutput out;
    EXPECT_EQ(TestShell().run(commandLine(words)), result) << ::testing::PrintToString(words);
    EXPECT_EQ(out.str(), output) << ::testing::PrintToString(words);
  }
}

TEST(Shell, Interactive) {
  const struct {
    std::string input;
    std::string output;
    bool result;
  } cases[] = {
      {"", "(/r)>> ", false},
      {"\n \t\v\r\f \nquit\nf\n", "(/r)>> (/r)>> (/r)>> ", true},
      {"f\nexit", "(/r)>> ?f /r:f() (/r)>> ", true},
      {"a x", "(/r)>> ?a /r:a(<x>) (/r)>> ", false},
      {"f -- a\na -- a\n", "(/r)>> ?f /r:f() (/r)>> ?a /r:a() ?a /r:a() (/r)>> ", false},
      {"a \"x\\ y\" #\n", "(/r)>> ?a /r:a(<\"x\\><y\"><#>) (/r)>> ", false},
      {"cd s\na\ncd /t\nback\nback\nback\n",
       "(/r)>> (/r/s)>> ?a /r/s:a() (/r/s)>> (/r/s/t)>> (/r/s)>> (/r)>> (/r)>> ", false},
      {"s t a\na\n", "(/r)>> ?s ?t ?a /r/s/t:a() (/r)>> ?a /r:a() (/r)>> ", false},
      {"s -- a\n", "(/r)>> ?s help /r/s (/r)>> ", false},
      {"s cd t\n", "(/r)>> ?s (/r/s/t)>> ", false},
      {"cd s/t/..\ncd ../..\n", "(/r)>> (/r/s)>> (/r)>> ", false},
      {"cd s/x/t\ncd /\ncd s t\n", "(/r)>> help /r/s (/r)>> (/r)>> help /r (/r)>> ", false},
      {"..\n", "(/r)>> \nInvalid command option '\033[31m..\033[39m'help /r (/r)>> ", false},
      {std::string("a\0b\xff\n", 5),
       std::string("(/r)>> \nInvalid command option '\033[31ma\0b\xff\033[39m'help /r (/r)>> ", 62),
       false},
  };
  for (const auto& [input, output, result] : cases) {
    const CapturedOutput out;
    const TypedInput in(input);
    EXPECT_EQ(TestShell().run(commandLine({})), result) << input;
    EXPECT_EQ(out.str(), output) << input;
  }
}

TEST(Shell, NeedsATreeButNoProgramName) {
  const CapturedOutput out;
  const TypedInput in("quit\n");
  TestShell treeless;
  treeless.hasTree = false;
  EXPECT_FALSE(treeless.run(commandLine({})));
  EXPECT_EQ(out.str(), "");
  EXPECT_TRUE(TestShell().run({}));
  EXPECT_EQ(out.str(), "(/r)>> ");
}

TEST(Help, ShowsTablesInTheirOwnOrderAndFlushesEachLine) {
  const auto root = Node::create(
      "root", {},
      [](Node& node) {
        node.handler("b", true, "[x|y] does b");
        node.handler("exactly16letters");
        node.handler("seventeen-letters");
        node.handler("Z", true, "upper case first");
        node.child("z", [](Node& one) { one.handler("only"); });
        node.child("hidden", [](Node& silent) {
          silent.child("deep", [](Node& deep) {
            deep.handler("q");
            deep.handler("p");
            deep.child("deeper", [](Node& deeper) { deeper.handler("r"); });
          });
        });
      },
      true);
  const CapturedOutput out(true);
  root->displayHelp();
  const std::string indent(16, ' ');
  EXPECT_EQ(out.str(),
            "\n$Options for command '\033[32mroot\033[39m':\n$\n$"
            "\t               Z  -  upper case first\n$\n$"
            "\t               b  -  [x|y] does b\n$\n$"
            "\texactly16letters  -  ...\n$\n$"
            "\tseventeen-letters  -  ...\n$\n$"
            "\t" +
                indent +
                "     <deep>  -  [p|q]\n$"
                "\t" +
                indent + indent +
                "     <deeper>  -  [r]\n$\n$"
                "\t               z  -  [only]\n$\n$"
                "\t              cd  -  <sub-command>\n$"
                "\t            help\n$\t            back\n$\t            quit\n$\n$");
}

TEST(Command, RegistersAndLooksUp) {
  const auto node = Node::create(
      "r", std::shared_ptr<CommandBase>(),
      [](Node& self) {
        self.addCommandHandler("empty", {}, "help of nothing");
        self.handler("h", false, "first");
        self.handler("h", true);
        self.child("c", [](Node&) {});
        self.child("c", [](Node&) {});
      },
      true);
  EXPECT_FALSE(node->isValidCommand("empty"));
  EXPECT_FALSE(node->isValidCommand("H"));
  EXPECT_EQ(node->getSubCommandObj("d"), nullptr);
  EXPECT_FALSE(node->isValidSubCommand("d"));
  EXPECT_EQ(node->getSubCommandObj("c")->getParent().lock(), node);
  EXPECT_EQ(node->getSubCommandObj("c")->getHierarchy(), "/r/c");
  const CapturedOutput out;
  EXPECT_TRUE(node->execCommand("h", {"last", "first"}));
  EXPECT_FALSE(node->execCommand("d", {}));
  EXPECT_FALSE(node->isValidCommand("d"));
  EXPECT_EQ(out.str(), "/r:h(<first><last>) ");
  node->displayHelp();
  EXPECT_NE(out.str().find("h  -  first\n"), std::string::npos) << "an empty help keeps the first";
}

TEST(Command, ReturnsWhenTheWorkOfItsHandlerHasEnded) {
  std::thread worker;
  std::atomic<bool> ended = false;
  const auto node = Node::create("r", {}, [&](Node& self) {
    self.addCommandHandler(
        "work",
        [&](const dispatch::group& group, const Words&) {
          worker = std::thread([&ended, member = dispatch::membership(group)] {
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
            ended = true;
          });
          return false;
        },
        "");
  });
  EXPECT_FALSE(node->execCommand("work", {}));
  EXPECT_TRUE(ended);
  worker.join();
}

}  // namespace
