#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <iomanip>
#include <iostream>
#include <sstream>

#include "framework/CommandShell.h"
#include "framework/WordList.h"
#include "fuzz/Node.h"
#include "tests/CapturedOutput.h"
#include "tests/FailingAllocations.h"
#include "tests/Program.h"
#include "tests/Table.h"

namespace {

using Words = std::list<std::string>;

/// Makes `text` what the program reads on standard input.
void typeIn(const std::string& text) {
  static std::stringbuf typed;
  typed.str(text);
  std::cin.rdbuf(&typed);
}

/// All succeed but f; s has the names of three of the shell's words; both is a handler and a
/// sub-command.
std::shared_ptr<Node> createTree() {
  auto root = Node::create("r", {});
  root->add("a both both/only nohandler nosub/a s/a s/cd s/help s/quit s/t/a");
  root->handler("f", false);
  return root;
}

class TestShell : public CommandShell {
 public:
  using CommandShell::CommandShell;
  bool hasTree = true;

 private:
  std::shared_ptr<CommandBase> createRootCommand() override {
    return hasTree ? createTree() : nullptr;
  }
};

/// The program's name and the words of `line`, as a word list; '' is an empty word, and _ a blank.
Words commandLine(const std::string& line) {
  auto words = convertLineToList("r " + line);
  for (auto& word : words) {
    std::ranges::replace(word, '_', ' ');
    if (word == "''") word.clear();
  }
  return words;
}

TEST(Shell, RunsCommandLinesAndTypedLines) {
  forEachRow("shell", 4, [](const Row& row) {
    const CapturedOutput out;
    typeIn(row[1]);
    EXPECT_EQ(TestShell().run(commandLine(row[0])), row[3] == "true");
    EXPECT_EQ(out.str(), row[2]);
  });
}

TEST(Shell, CompletesFromTheTreeAloneWithoutAsking) {
  const auto root = createTree();
  root->handler("opt", true, "[fast|slow|tar.gz] <why> does [it]", "takes minutes");
  root->handler("out", true, "[how many] [output file path] -p <a b..> -i <c> writes -x");
  const ScratchFolder folder;
  std::filesystem::create_directory(folder.path("logs"));
  for (const auto* const name : {"one.txt", ".hidden", "a name", "logs/new.txt"}) {
    writeFile(folder.path(name), "");
  }
  std::filesystem::current_path(folder.path(""));
  const CapturedOutput out;
  forEachRow("completion", 2, [&root](const Row& row) {
    std::string offered;
    for (const auto& [word, note] : root->complete(row[0])) {
      offered += (offered.empty() ? "" : " ") + word + (note.empty() ? "" : '(' + note + ')');
    }
    EXPECT_EQ(offered, row[1] == " " ? "" : row[1]);
  });
  EXPECT_EQ(out.str(), "");
  for (int nth = 1; failAllocation(nth, [&root] { root->complete("out 1 "); }); ++nth) {
  }
}

TEST(Shell, NeedsATreeAndReadsWithTheReaderThatItIsGivenUntilThatHasNoTerminal) {
  std::vector<std::optional<bool>> answers = {true, std::nullopt, false};
  TestShell shell([&](const std::string& prompt, const auto& complete, std::string& line) {
    std::cout << prompt << complete("a").begin()->first << ' ';
    const auto answer = answers.front();
    answers.erase(answers.begin());
    line = answer ? "cd s" : "";
    return answer;
  });
  const CapturedOutput out;
  typeIn("a\n");
  shell.hasTree = false;
  EXPECT_FALSE(shell.run({"r"}));
  EXPECT_EQ(out.str(), "");
  shell.hasTree = true;
  EXPECT_FALSE(shell.run({})) << "it needs no program name";
  EXPECT_EQ(out.str(), "$(/r)>> a $(/r/s)>> a (/r/s)>> $$?a /r/s:a() $(/r/s)>> a ");
}

TEST(Command, ShowsItsTablesInOrderAndRunsWhatIsInThem) {
  const auto root = Node::create("root", {});
  root->handler("b", false, "earlier");
  root->handler("b", false, "[x|y] does b");
  root->add("b");  // an empty help keeps the one before
  root->addCommandHandler("null", {}, "help of nothing");
  root->handler("Z", true, "upper case first");
  root->add("exactly16letters seventeen-letters z/only");
  root->add("hidden/deep/q hidden/deep/p hidden/deep/deeper/r");
  const CapturedOutput out;
  std::cout << std::left << std::setfill('*') << std::setw(20);  // what others have left there
  root->CommandBase::displayHelp();
  EXPECT_EQ(std::cout.width(0), 20);
  std::cout.copyfmt(std::ios(nullptr));
  forEachRow("help", 1, [&out](const Row& row) { EXPECT_EQ(out.str(), row[0]); });
  EXPECT_TRUE(root->execCommand("b", {}));
  auto renew = [&root, own = std::make_shared<int>()](auto, auto) {
    root->handler("anew");
    return own.use_count() == 1;
  };
  root->addCommandHandler("anew", std::move(renew), "");
  EXPECT_TRUE(root->execCommand("anew", {}));
  EXPECT_FALSE(root->execCommand("null", {}) || root->execCommand("none", {}));
}

}  // namespace
