#include "framework/Completion.h"

#include <algorithm>
#include <filesystem>
#include <set>

#include "framework/WordList.h"

namespace {

using Node = std::shared_ptr<CommandBase>;
using Words = std::list<std::string>;
using Offer = std::set<std::string>;

constexpr auto kNextGroup = "--";

/// What the help text of a handler says of its words.
struct Usage {
  std::vector<std::string> places;  // of words that come first, each as the text describes it
  Offer options;
};

/// What ends a piece of a help text that starts with `opening`.
char Closing(char opening) {
  if (opening == '[') return ']';
  return opening == '<' ? '>' : ' ';
}

/// Reads the brackets, angles and dashes in front of the description.
Usage ReadUsage(const std::string& help) {
  Usage usage;
  for (auto at = help.find_first_not_of(' '); at != std::string::npos;
       at = help.find_first_not_of(' ', at)) {
    const char kind = help[at];
    if (kind != '[' && kind != '<' && kind != '-') break;
    const auto end = std::min(help.find(Closing(kind), at), help.size());
    const auto text = help.substr(at + 1, end - at - 1);
    if (kind == '-') {
      usage.options.insert('-' + text);
    } else if (kind == '[' && text.find(' ') != std::string::npos) {
      usage.places.push_back(text);
    } else if (kind == '[') {
      for (std::size_t start = 0, bar = 0; bar < text.size(); start = bar + 1) {
        bar = std::min(text.find('|', start), text.size());
        usage.options.insert(text.substr(start, bar - start));
      }
    }
    at = std::min(end + 1, help.size());
  }
  return usage;
}

/// The files whose paths start with `start`, folders with a slash at their end. A name with white
/// space in it cannot be typed as a word; one with a dot in front is offered to who types the dot.
Offer Files(const std::string& start) {
  Offer files;
  const auto folder = start.substr(0, start.rfind('/') + 1);
  std::error_code unreadable;
  std::filesystem::directory_iterator entry(folder.empty() ? "." : folder, unreadable);
  for (; !unreadable && entry != end(entry); entry.increment(unreadable)) {
    const std::string name = entry->path().filename();
    const bool isShown = !name.starts_with('.') || start.size() > folder.size();
    if (!isShown || convertLineToList(name) != Words{name}) continue;
    std::error_code gone;
    files.insert(folder + name + (entry->is_directory(gone) ? "/" : ""));
  }
  return files;
}

/// The paths that "cd" can follow from `node`, one element further than `start`.
Offer Paths(Node node, const std::string& start) {
  const auto followed = start.substr(0, start.rfind('/') + 1);
  for (const auto& element : splitCmdPath(followed)) {
    node = node->getNodeAt(element);
    if (!node) return {};
  }
  Offer paths;
  for (const auto& name : node->getSubCommandNames()) {
    const bool goesOn = !node->getSubCommandObj(name)->getSubCommandNames().empty();
    paths.insert(followed + name + (goesOn ? "/" : ""));
  }
  if (node->getParent().lock()) paths.insert(followed + "..");
  return paths;
}

bool EqualsIgnoringCase(const std::string& one, const std::string& other) {
  const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; };
  return std::ranges::equal(one, other, {}, lower, lower);
}

/// After a handler and its `words`. A first word that is no option ends the options, unless those
/// with a dash in front take words of their own.
Offer Options(Usage usage, Words words, const std::string& start) {
  for (const auto& place : usage.places) {
    if (words.empty()) return place.ends_with("file path") ? Files(start) : Offer();
    words.pop_back();
  }
  auto& options = usage.options;
  const auto isOption = [&options](const std::string& word) {
    return std::ranges::any_of(
        options, [&](const auto& option) { return EqualsIgnoringCase(option, word); });
  };
  const bool takeWords =
      std::ranges::any_of(options, [](const auto& option) { return option.starts_with('-'); });
  if (!takeWords && !std::ranges::all_of(words, isOption)) options.clear();
  options.insert(kNextGroup);
  return options;
}

/// What can follow `words`, the words of one group, at `node`; looked up as the shell does.
Offer Following(Node node, Words words, const std::string& start) {
  Offer offer = {"cd", "help"};
  if (words.empty()) offer.insert({"back", "quit", "exit"});
  while (!words.empty()) {
    const auto word = TakeNextWord(words);
    if (word == "cd" && words.empty()) return Paths(node, start);
    if (word == "cd") return {kNextGroup};
    if (node->isValidCommand(word))
      return Options(ReadUsage(node->getHelpText(word)), words, start);
    node = node->getSubCommandObj(word);
    if (!node) return {kNextGroup};
  }
  offer.merge(node->getCommandNames());
  offer.merge(node->getSubCommandNames());
  return offer;
}

}  // namespace

std::vector<std::string> CompleteLine(const Node& node, const std::string& typed) {
  auto words = convertLineToList(typed + '.');  // so that there is a last word, if only the dot
  auto start = words.front();
  start.pop_back();
  words.pop_front();
  words.erase(std::ranges::find(words, kNextGroup), words.end());  // groups before the last
  std::vector<std::string> candidates;
  for (const auto& word : Following(node, words, start)) {
    if (word.starts_with(start)) candidates.push_back(word);
  }
  return candidates;
}
