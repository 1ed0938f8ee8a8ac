// Any typed line and any "cd" path: what the tokenizer promises holds, and nothing is lost.

#include <cstdint>
#include <cstdlib>
#include <sstream>

#include "framework/WordList.h"

namespace {

void require(bool holds) {
  if (!holds) std::abort();
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
  return 0;
}
