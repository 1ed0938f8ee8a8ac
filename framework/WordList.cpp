#include "framework/WordList.h"

#include <algorithm>
#include <utility>

std::string TakeNextWord(std::list<std::string>& words) {
  std::string word = std::move(words.back());
  words.pop_back();
  return word;
}

std::list<std::string> convertLineToList(const std::string& line) {
  constexpr auto kWhiteSpace = " \t\n\v\f\r";  // of the "C" locale
  std::list<std::string> words;
  for (auto start = line.find_first_not_of(kWhiteSpace); start != std::string::npos;) {
    const auto end = std::min(line.find_first_of(kWhiteSpace, start), line.size());
    words.emplace_front(line, start, end - start);
    start = line.find_first_not_of(kWhiteSpace, end);
  }
  return words;
}

std::vector<std::list<std::string>> splitCmdList(std::list<std::string> words) {
  std::vector<std::list<std::string>> batch;
  std::list<std::string> group;
  while (!words.empty()) {
    if (words.back() != "--") {
      group.splice(group.begin(), words, std::prev(words.end()));
      continue;
    }
    words.pop_back();
    if (!group.empty()) batch.push_back(std::exchange(group, {}));
  }
  if (!group.empty()) batch.push_back(std::move(group));
  return batch;
}

std::vector<std::string> splitCmdPath(std::string path) {
  std::ranges::replace(path, '/', ' ');
  const auto words = convertLineToList(path);
  return {words.rbegin(), words.rend()};
}
