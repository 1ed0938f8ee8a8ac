// Any typed line and any "cd" path: what the tokenizer promises holds, and nothing is lost; and
// what completes the line continues its last word.

#include <strings.h>

#include <cstdint>
#include <cstdlib>
#include <sstream>

#include "framework/WordList.h"
#include "fuzz/Node.h"

namespace {

void require(bool holds) {
  if (!holds) std::abort();
}

/// A node and its child, with options but no files to complete.
std::shared_ptr<Node> createTree() {
  auto root = Node::create("root", {});
  const auto dump = Node::create("dump", root);
  root->addSubCommand("dump", dump);
  for (const auto& node : {root, dump}) {
    node->handler("tel", true, "[nocompress|tar.gz|tar] [nonui] <reason> collect logs");
    node->handler("log", true, "[history size] -p <a b..> -i <c d..> export logs");
  }
  return root;
}

void requireCompletion(const std::string& line) {
  static const auto root = createTree();
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
