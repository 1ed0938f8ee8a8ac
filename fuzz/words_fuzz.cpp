// Any typed line and any "cd" path: what the tokenizer promises holds, and nothing is lost; and
// what completes the line continues its last word.

#include <strings.h>

#include <cstdint>
#include <cstdlib>
#include <sstream>

#include "framework/CommandBase.h"
#include "framework/WordList.h"

namespace {

void require(bool holds) {
  if (!holds) std::abort();
}

/// A node with a child of its kind, and with options but no files to complete.
class Node : public CommandBase {
 public:
  static std::shared_ptr<CommandBase> create(const std::string& name,
                                             std::weak_ptr<CommandBase> parent) {
    std::shared_ptr<CommandBase> node(new Node(name, std::move(parent)));
    node->init();
    return node;
  }

 private:
  using CommandBase::CommandBase;
  void registerCommands() override {
    const auto nothing = [](const dispatch::group&, const std::list<std::string>&) { return true; };
    addCommandHandler("tel", nothing, "[nocompress|tar.gz|tar] [nonui] <reason> collect logs");
    addCommandHandler("log", nothing, "[history size] -p <a b..> -i <c d..> export logs");
    if (!getParent().lock()) addSubCommand("dump", create("dump", weak_from_this()));
  }
};

void requireCompletion(const std::string& line) {
  static const auto root = Node::create("root", {});
  auto last = convertLineToList(line + '.').front();
  last.pop_back();
  for (const auto& [word, note] : root->complete(line)) {
    require(strncasecmp(word.c_str(), last.c_str(), last.size()) == 0);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string line(reinterpret_cast<const char*>(data), size);
  auto words = convertLineToList(line);
  std::size_t separators = 0;
  std::istringstream expected(line);
  for (auto word = words.rbegin(); word != words.rend(); ++word) {
    std::string next;
    require((expected >> next) && next == *word);
    if (*word == "--") ++separators;
  }
  std::size_t grouped = 0;
  for (const auto& group : splitCmdList(words)) {
    require(!group.empty());
    for (const auto& word : group) require(word != "--");
    grouped += group.size();
  }
  require(grouped + separators == words.size());
  for (const auto& element : splitCmdPath(line)) {
    require(!element.empty() && element.find('/') == std::string::npos);
  }
  requireCompletion(line);
  return 0;
}
