// Types at random at a terminal, and compares the lines that arrive with those that a model of the
// keys predicts. Part of the tests; ZUB_SEED and ZUB_LINES choose how it begins and how long it is.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <iostream>
#include <random>
#include <sstream>
#include <utility>
#include <vector>

#include "fuzz/Typist.h"

namespace {

/// What keys do to a line, as plainly as can be. The characters that are typed here are ASCII, a
/// combining one, those of UTF-8 beyond, and bytes 0xFF.
class Model {
 public:
  void press(const std::string& key) {
    const bool hadKilled = std::exchange(hasKilled, false);
    const auto kill = [&](std::size_t from, std::size_t to, bool isToLeft) {
      const auto text = erase(from, to);
      killed = !hadKilled ? text : isToLeft ? text + killed : killed + text;
      hasKilled = true;
    };
    if (key == "\001") cursor = 0;
    if (key == "\005") cursor = line.size();
    if (key == "\033[D") cursor = next(-1);
    if (key == "\033[C") cursor = next(1);
    if (key == "\033b") cursor = nextWord(-1);
    if (key == "\033f") cursor = nextWord(1);
    if (key == "\177") erase(next(-1), cursor);
    if (key == "\033[3~" || key == "\004") erase(cursor, next(1));
    if (key == "\013") kill(cursor, line.size(), false);
    if (key == "\033d") kill(cursor, nextWord(1), false);
    if (key == "\025") kill(0, cursor, true);
    if (key == "\027") kill(nextWord(-1), cursor, true);
    if (key == "\031") insert(killed);
    if (key == "\033[A") show(place > 0 ? place - 1 : 0);
    if (key == "\033[B") show(std::min(place + 1, lines.size() - 1));
    if (key == kSearch) search("a");
    if (key == kPaste) insert("a z");
    if (key == "\024" && cursor > 0) {
      if (cursor == line.size()) cursor = next(-1);
      const auto text = erase(cursor, next(1));
      cursor = next(-1);
      insert(text);
      cursor = next(1);
    }
    if (key[0] < 0 || (key[0] >= ' ' && key[0] != 0x7F)) insert(key);
  }

  /// Gives the line up, or takes it.
  void finish(bool isTaken) {
    if (!isTaken) line.clear();
    if (line.find_first_not_of(' ') != std::string::npos && (kept.empty() || kept.back() != line)) {
      kept.push_back(line);
    }
    lines = kept;
    lines.emplace_back();
    place = kept.size();
  }

  void begin() {
    line.clear();
    cursor = 0;
    hasKilled = false;
  }

  static constexpr auto kSearch = "\022a\001";
  static constexpr auto kPaste = "\033[200~a\tz\033[201~";
  std::string line;

 private:
  void insert(const std::string& text) {
    line.insert(cursor, text);
    cursor += text.size();
  }

  std::string erase(std::size_t from, std::size_t to) {
    auto text = line.substr(from, to - from);
    line.erase(from, to - from);
    cursor = from;
    return text;
  }

  /// The next place to the left, or right, at which `isThere` finds what is there and before it.
  std::size_t reach(int step, auto isThere) const {
    auto at = cursor;
    do {
      if (at == (step < 0 ? 0 : line.size())) return at;
      at += static_cast<std::size_t>(step);
    } while (at > 0 && at < line.size() && !isThere(line.substr(at), line[at - 1]));
    return at;
  }

  std::size_t next(int step) const {
    return reach(step, [](const std::string& rest, char) {
      return (rest[0] & 0xC0) != 0x80 && !rest.starts_with("\xCC\x81");
    });
  }

  std::size_t nextWord(int step) const {
    return reach(step, [step](const std::string& rest, char before) {
      return rest[0] != before && (step < 0 ? before : rest[0]) == ' ';
    });
  }

  void show(std::size_t at) {
    lines[place] = line;
    place = at;
    line = lines[place];
    cursor = line.size();
  }

  void search(const std::string& wanted) {
    auto at = std::min(place + 1, kept.size());
    while (at > 0 && lines[at - 1].find(wanted) == std::string::npos) --at;
    if (at > 0) show(at - 1);
    cursor = 0;
  }

  std::size_t cursor = 0;
  std::string killed;
  bool hasKilled = false;
  std::vector<std::string> kept;
  std::vector<std::string> lines = {""};  // with the new one, as they have been edited
  std::size_t place = 0;
};

TEST(EditedLine, IsWhatAModelOfTheKeysPredicts) {
  const char* const chosen = std::getenv("ZUB_SEED");
  const auto seed = chosen != nullptr ? std::strtoul(chosen, nullptr, 10) : std::random_device()();
  const char* const wanted = std::getenv("ZUB_LINES");
  const auto count = wanted != nullptr ? std::strtoul(wanted, nullptr, 10) : 300;
  std::cout << "ZUB_SEED=" << seed << " ZUB_LINES=" << count << std::endl;
  std::mt19937 random(static_cast<unsigned>(seed));
  const auto below = [&random](std::size_t limit) { return random() % limit; };
  std::istringstream list(
      "\001|\005|\033[D|\033[C|\033b|\033f|\177|\033[3~|\013|\033d|\025|\027|\031|\033[A|\033[B|"
      "\024|\004|"
      "\t|\014|\037|\033[15~|\033[<0;3;4M|a|b c| |\xC3\xA9|\xE4\xB8\x96|\xCC\x81|\xFF|" +
      std::string(300, 'y') + '|' + Model::kSearch + '|' + Model::kPaste);
  std::vector<std::string> keys;
  for (std::string key; std::getline(list, key, '|');) keys.push_back(key);
  const auto someSize = [&below] {
    const std::size_t limit = below(2) == 0 ? 1 : 5;
    return winsize{.ws_row = static_cast<unsigned short>(2 + below(10 * limit - 1)),
                   .ws_col = static_cast<unsigned short>(4 + below(40 * limit - 3)),
                   .ws_xpixel = 0,
                   .ws_ypixel = 0};
  };
  for (unsigned long typed = 0; typed < count && !HasFailure();) {
    constexpr const char* kTerms[] = {"xterm-256color", "screen-256color", "linux", "vt100"};
    Typist typist(kTerms[below(4)], someSize());
    Model model;
    for (int line = 0; line < 20 && !HasFailure(); ++line, ++typed) {
      model.begin();
      for (auto key = below(40); key > 0; --key) {
        const auto& pressed = keys[below(keys.size())];
        if (pressed == "\004" && model.line.empty()) continue;
        model.press(pressed);
        typist.type(pressed);
        if (below(20) > 0) continue;
        const auto size = someSize();
        ioctl(typist.terminal, TIOCSWINSZ, &size);
      }
      const bool isTaken = below(10) > 0;
      typist.type(isTaken ? "\r" : "\003");
      model.finish(isTaken);
      EXPECT_EQ(typist.line(), model.line);
    }
    typist.type("\004");
    EXPECT_EQ(typist.ended(), 7);
    EXPECT_TRUE(isAsItWas(typist.terminal));
  }
}

}  // namespace
