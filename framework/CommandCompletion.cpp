#include <dirent.h>
#include <strings.h>

#include <algorithm>
#include <filesystem>
#include <sstream>

#include "framework/CommandBase.h"
#include "framework/WordList.h"

namespace {

using Candidates = CommandBase::Candidates;
using Words = std::list<std::string>;

constexpr auto kNextGroup = "--";

/// The arguments of a handler, from its help text.
struct Usage {
  Words places;   ///< descriptions of the arguments that come first
  Words options;  ///< those with a dash take arguments
};

/// Reads the brackets, angles and dashes in front of the description.
Usage ReadUsage(const std::string& help) {
  constexpr std::string_view kOpening = "[<-";
  constexpr std::string_view kClosing = "]> ";
  Usage usage;
  std::istringstream rest(help);
  char kind = 0;
  while (rest >> kind && kOpening.find(kind) != std::string_view::npos) {
    std::string text;
    std::getline(rest, text, kClosing[kOpening.find(kind)]);
    if (kind == '-') {
      usage.options.push_back('-' + text);
    } else if (kind == '[' && text.find(' ') != std::string::npos) {
      usage.places.push_back(text);
    } else if (kind == '[') {
      std::ranges::replace(text, '|', ' ');
      usage.options.splice(usage.options.end(), convertLineToList(text));
    }
  }
  return usage;
}

/// Those of `candidates` that start with `start`.
Candidates StartingWith(const std::string& start, Candidates candidates) {
  std::erase_if(candidates, [&](const auto& one) { return !one.first.starts_with(start); });
  return candidates;
}

/// The files whose paths start with `start`; folders end in a slash. Names with white space are
/// left out, because they cannot be typed as a word, and so are hidden files unless the dot is
/// typed. Reads the folder with the C library: without memory, an iterator of the C++ library ends
/// the process.
Candidates Files(const std::string& start) {
  Candidates files;
  const auto folder = start.substr(0, start.rfind('/') + 1);
  const std::unique_ptr<DIR, int (*)(DIR*)> opened(opendir(folder.empty() ? "." : folder.c_str()),
                                                   closedir);
  if (!opened) return files;
  while (const dirent* const entry = readdir(opened.get())) {
    const std::string name = entry->d_name;
    const bool isShown = !name.starts_with('.') || start.size() > folder.size();
    if (!isShown || name == "." || name == ".." || convertLineToList(name) != Words{name}) continue;
    std::error_code gone;
    files[folder + name + (std::filesystem::is_directory(folder + name, gone) ? "/" : "")];
  }
  return StartingWith(start, files);
}

/// Candidates after a handler and its `words`.
Candidates Options(Usage usage, Words words, const std::string& start) {
  for (const auto& place : usage.places) {
    if (words.empty()) return place.ends_with("file path") ? Files(start) : Candidates();
    words.pop_back();
  }
  auto& options = usage.options;
  const auto isOption = [&options](const std::string& word) {
    return std::ranges::any_of(options, [&word](const auto& option) {
      return strcasecmp(option.c_str(), word.c_str()) == 0;
    });
  };
  const bool takeWords =
      std::ranges::any_of(options, [](const auto& option) { return option.starts_with('-'); });
  // The next word is an argument of an option, or follows the word that ended the options.
  const bool isFree =
      takeWords ? !words.empty() && isOption(words.front()) : !std::ranges::all_of(words, isOption);
  if (isFree || options.empty()) return {};
  options.push_back(kNextGroup);
  Candidates offered;
  for (const auto& option : options) {
    if (strncasecmp(option.c_str(), start.c_str(), start.size()) == 0) offered[option];
  }
  return offered;
}

}  // namespace

CommandBase::Candidates CommandBase::complete(const std::string& typed) {
  auto words = convertLineToList(typed + '.');  // the dot makes sure of a last word
  auto start = words.front();
  start.pop_back();
  words.pop_front();
  words.erase(std::ranges::find(words, kNextGroup), words.end());  // earlier groups
  const bool isFirst = words.empty();
  auto node = shared_from_this();  // found as the shell finds it
  while (!words.empty()) {
    const auto word = TakeNextWord(words);
    if (word == "cd") return words.empty() ? node->completePath(start) : Candidates();
    if (node->isValidCommand(word)) return Options(ReadUsage(node->helpOf(word)), words, start);
    node = node->getSubCommandObj(word);
    if (!node) return {};
  }
  return node->completeName(start, isFirst);
}

CommandBase::Candidates CommandBase::completeName(const std::string& start, bool isFirst) const {
  Candidates names = commandNotes;
  for (const auto& [word, child] : subCommands) names[word];
  for (const auto* const word : {"cd", "help"}) names[word];
  if (isFirst) {
    for (const auto* const word : {"back", "quit", "exit"}) names[word];
  }
  return StartingWith(start, names);
}

/// The paths of "cd" that start with `start` and have no further slash but at their end.
CommandBase::Candidates CommandBase::completePath(const std::string& start) {
  const auto followed = start.substr(0, start.rfind('/') + 1);
  auto node = shared_from_this();
  for (const auto& element : splitCmdPath(followed)) {
    node = node->getNodeAt(element);
    if (!node) return {};
  }
  Candidates paths;
  for (const auto& [word, child] : node->subCommands) {
    paths[followed + word + (child->subCommands.empty() ? "" : "/")];
  }
  if (node->parent.lock()) paths[followed + ".."];
  return StartingWith(start, paths);
}
