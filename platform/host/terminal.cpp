#include "platform/terminal.h"

#include <unistd.h>

#include <algorithm>
#include <map>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/host/EditedLine.h"
#include "platform/host/LineDisplay.h"
#include "platform/host/TerminalSession.h"
#include "platform/posix/Utf8.h"

namespace {

using Candidates = std::map<std::string, std::string>;
using host::EditedLine;
using host::TerminalSession;
using Event = TerminalSession::Event;
using enum host::EditedLine::Motion;

constexpr std::size_t kLongestHistory = 1000;  // lines
constexpr int kRestOfSequence = 500;           // milliseconds for the next byte of a key's sequence
constexpr std::string_view kBackspace = "\x08 \x7F";
constexpr std::string_view kCtrlG = "\a";
constexpr std::string_view kCtrlR = "\x12";
constexpr std::string_view kEndOfPaste = "\033[201~";

/// Whether `key` is one of `keys`, which blanks separate.
bool isOneOf(std::string_view keys, const std::string& key) {
  return (' ' + std::string(keys) + ' ').find(' ' + key + ' ') != std::string::npos;
}

bool isText(const std::string& key) {
  return key.size() == 1 && static_cast<unsigned char>(key[0]) >= ' ' && key[0] != 0x7F;
}

/// Whether `key`, which starts with an escape, is all that the key sends.
bool isWhole(std::string_view key) {
  if (key.size() < 2) return false;
  if (key[1] != '[' && key[1] != 'O') return key.size() > posix::utf8Length(key[1]);
  if (key.starts_with("\033[M")) return key.size() == 6;  // a mouse, and where it is
  if (key.starts_with("\033[[")) return key.size() == 4;  // a function key of Linux's console
  return key.size() > 2 && (key.back() < 0x20 || key.back() >= 0x40);  // ECMA-48, 5.4
}

std::size_t columnsOf(const std::vector<host::Cell>& cells) {
  std::size_t columns = 0;
  for (const auto& cell : cells) columns += cell.columns;
  return columns;
}

/// What `candidates` have in common at their start, in whole characters.
std::string commonStart(const Candidates& candidates) {
  const auto& first = candidates.begin()->first;
  const auto& last = candidates.rbegin()->first;  // the least alike, for they are sorted
  std::string common(first.begin(), std::ranges::mismatch(first, last).in1);
  if (posix::isUtf8(first)) {
    while (!posix::isUtf8(common)) common.pop_back();
  }
  return common;
}

/// What stays from one line to the next.
struct Memory {
  std::vector<std::string> history;
  std::string pasted;  // the lines of a paste that have not been in the editor yet
  std::string killed;  // text to bring back with Ctrl-Y
};

/// The editing of one line.
class Editor {
 public:
  Editor(Memory& memory, const std::string& prompt, const platform::LineCompleter& complete)
      : memory(memory), prompt(prompt), complete(complete) {
    lines.emplace_back();
  }

  /// True for a line, false at the end of the input.
  bool read(std::string& result) {
    takePasted();
    draw();
    while (!isLine) {
      const auto key = readKey();
      if (key.empty()) return false;
      press(key);
    }
    result = line.text();
    return *isLine;
  }

 private:
  /// Reads all that one key sends; nothing at the end of the input.
  std::string readKey() {
    std::string key;
    if (!readByte(key, -1) || key != "\033") return key;
    while (!isWhole(key) && readByte(key, kRestOfSequence)) {
      if (key == "\033\033") key.pop_back();  // Alt with a key that starts with an escape itself
    }
    if (key.starts_with("\033O")) key[1] = '[';  // what a terminal sends in its application mode
    return key;
  }

  /// Adds a byte to `key`. False at the end of the input, or when none comes within `milliseconds`.
  /// Before it waits, the screen shows what has been typed.
  bool readByte(std::string& key, int milliseconds) {
    for (;;) {
      auto event = session.wait(0);
      if (event == Event::timeout) {
        draw();
        event = session.wait(milliseconds);
      }
      if (event == Event::timeout) return false;
      if (event == Event::resized) display.clear();
      if (event == Event::continued) display.forget();
      if (event == Event::input) return session.read(key);
    }
  }

  void draw() { display.draw(prompt + line.text(), prompt.size() + line.beforeCursor().size()); }

  /// The keys that are no text, as terminals send them, separated by blanks; and what they do.
  static const auto& bindings() {
    static constexpr std::pair<std::string_view, void (*)(Editor&)> kBindings[] = {
        {"\x01 \033[H \033[1~ \033[7~", [](Editor& e) { e.line.move(toStart); }},
        {"\x05 \033[F \033[4~ \033[8~", [](Editor& e) { e.line.move(toEnd); }},
        {"\x02 \033[D \033[1;2D", [](Editor& e) { e.line.move(left); }},
        {"\x06 \033[C \033[1;2C", [](Editor& e) { e.line.move(right); }},
        {"\033b \033[1;5D \033[1;3D", [](Editor& e) { e.line.move(wordLeft); }},
        {"\033f \033[1;5C \033[1;3C", [](Editor& e) { e.line.move(wordRight); }},
        {kBackspace, [](Editor& e) { e.line.erase(left); }},
        {"\033[3~", [](Editor& e) { e.line.erase(right); }},
        {"\x0B", [](Editor& e) { e.kill(toEnd); }},
        {"\x15", [](Editor& e) { e.kill(toStart); }},
        {"\x17 \033\x7F \033\x08", [](Editor& e) { e.kill(wordLeft); }},
        {"\033d \033[3;5~ \033[3;3~", [](Editor& e) { e.kill(wordRight); }},
        {"\x19", [](Editor& e) { e.line.insert(e.memory.killed); }},
        {"\x14", [](Editor& e) { e.line.transpose(); }},
        {"\x10 \033[A", [](Editor& e) { e.show(e.place > 0 ? e.place - 1 : 0); }},
        {"\x0E \033[B", [](Editor& e) { e.show(std::min(e.place + 1, e.lines.size() - 1)); }},
        {kCtrlR, [](Editor& e) { e.search(); }},
        {"\t", [](Editor& e) { e.completeWord(); }},
        {"\x0C", [](Editor& e) { e.clearScreen(); }},
        {"\r \n", [](Editor& e) { e.accept(); }},
        {"\x03", [](Editor& e) { e.giveUp(); }},
        {"\x04", [](Editor& e) { e.eraseOrEnd(); }},
        {"\033[200~", [](Editor& e) { e.paste(); }},
    };
    return kBindings;
  }

  void press(const std::string& key) {
    hadKilled = std::exchange(hasKilled, false);
    if (isText(key)) return line.insert(key);
    for (const auto& [keys, act] : bindings()) {
      if (isOneOf(keys, key)) return act(*this);
    }
  }

  void accept() {
    draw();
    display.append("");
    isLine = true;
    auto& history = memory.history;
    const bool isBlank = line.text().find_first_not_of(' ') == std::string::npos;
    if (isBlank || (!history.empty() && history.back() == line.text())) return;
    if (history.size() == kLongestHistory) history.erase(history.begin());
    history.push_back(line.text());
  }

  /// Ctrl-C. The lines of a paste that are still to come go as well.
  void giveUp() {
    line.set(line.text() + "^C");
    draw();
    display.append("");
    line.set("");
    memory.pasted.clear();
    isLine = true;
  }

  void eraseOrEnd() {
    if (line.text().empty()) isLine = false;
    line.erase(right);
  }

  void clearScreen() {
    session.write("\033[H\033[2J");
    display.forget();
  }

  /// Erases for Ctrl-Y: what several keys in a row erase, as one text.
  void kill(EditedLine::Motion motion) {
    const bool isToLeft = motion == toStart || motion == wordLeft;
    const auto erased = line.erase(motion);
    if (!hadKilled) memory.killed.clear();
    memory.killed.insert(isToLeft ? 0 : memory.killed.size(), erased);
    hasKilled = true;
  }

  /// Has the lines of a paste in the editor one after the other: none runs without a key for it.
  /// All other white space separates words, as a blank does.
  void paste() {
    std::string text;
    while (!text.ends_with(kEndOfPaste) && readByte(text, -1)) {
    }
    if (text.ends_with(kEndOfPaste)) text.resize(text.size() - kEndOfPaste.size());
    std::ranges::replace(text, '\r', '\n');
    std::ranges::replace_if(
        text, [](char c) { return c == '\t' || c == '\v' || c == '\f'; }, ' ');
    if (!memory.pasted.empty() && !text.ends_with('\n')) text += '\n';
    memory.pasted.insert(0, text);
    takePasted();
  }

  void takePasted() {
    const auto end = std::min(memory.pasted.find('\n'), memory.pasted.size());
    line.insert(memory.pasted.substr(0, end));
    memory.pasted.erase(0, end + 1);
  }

  void show(std::size_t newPlace) {
    lines[place] = line.text();
    place = newPlace;
    line.set(lines[place]);
  }

  /// Ctrl-R. Any key that is not for the search ends it, and does what it does to what was found.
  void search() {
    EditedLine wanted;
    const auto promptBefore = prompt;
    const auto placeBefore = place;
    for (;;) {
      prompt = "(search)`" + wanted.text() + "': ";
      const auto key = readKey();
      if (key == kCtrlR) {
        find(wanted.text(), place);
      } else if (isOneOf(kBackspace, key)) {
        wanted.erase(left);
        show(placeBefore);
        find(wanted.text(), lines.size() - 1);
      } else if (isText(key)) {
        wanted.insert(key);
        find(wanted.text(), std::min(place + 1, lines.size() - 1));
      } else {
        prompt = promptBefore;
        if (key != kCtrlG) return press(key);
        return show(placeBefore);
      }
    }
  }

  /// Goes to the newest line before `end` that holds `wanted`; stays where there is none.
  void find(const std::string& wanted, std::size_t end) {
    while (!wanted.empty() && end-- > 0) {
      const auto found = lines[end].find(wanted);
      if (found == std::string::npos) continue;
      show(end);
      return line.set(line.text(), found);
    }
  }

  /// Tab. Extends the word as far as all candidates agree; where that is no further, lists them.
  void completeWord() {
    const auto typed = line.beforeCursor();
    const auto candidates = complete(typed);
    if (candidates.empty()) return;
    const auto start = typed.rfind(' ') + 1;
    auto word = commonStart(candidates);
    if (candidates.size() == 1 && !word.ends_with('/')) word += ' ';
    if (start + word.size() <= typed.size()) return list(candidates);
    const auto rest = line.text().substr(typed.size());
    line.set(typed.substr(0, start) + word + rest, start + word.size());
  }

  /// Lists the candidates under the line, as many as the screen holds.
  void list(const Candidates& candidates) {
    std::vector<std::vector<host::Cell>> labels;
    std::size_t widest = 0;
    for (const auto& [word, note] : candidates) {
      const auto name = word.substr(word.rfind('/', word.size() - 2) + 1);  // a path's last element
      labels.push_back(host::cellsOf(note.empty() ? name : name + " (" + note + ')'));
      widest = std::max(widest, columnsOf(labels.back()) + 2);
    }
    const auto [height, width] = host::sizeOfTerminal();
    const auto columns = std::max<std::size_t>(1, width / widest);
    const auto shown = std::min(labels.size(), columns * (height > 4 ? height - 3 : 1));
    std::string text;
    for (std::size_t i = 0; i < shown; ++i) {
      const bool isLast = (i + 1) % columns == 0 || i + 1 == shown;
      for (const auto& cell : labels[i]) text += cell.glyph;
      text += isLast ? "\r\n" : std::string(widest - columnsOf(labels[i]), ' ');
    }
    if (shown < labels.size()) text += "... " + std::to_string(labels.size() - shown) + " more\r\n";
    draw();
    display.append(text);
  }

  Memory& memory;
  std::string prompt;  // of the line, or of the search that is under way
  const platform::LineCompleter& complete;
  TerminalSession session;
  host::LineDisplay display{session};
  EditedLine line;
  std::vector<std::string> lines = memory.history;  // and the new one, as they have been edited
  std::size_t place = lines.size();                 // of the line in the editor
  bool hasKilled = false;                           // the last key
  bool hadKilled = false;                           // and the one before
  std::optional<bool> isLine;                       // how the editing has ended
};

}  // namespace

std::optional<bool> platform::readEditedLine(const std::string& prompt,
                                             const LineCompleter& complete, std::string& line) {
  static const bool isEditing =
      host::canMoveCursor(STDIN_FILENO) && host::canMoveCursor(STDOUT_FILENO);
  if (!isEditing) return std::nullopt;
  static auto& memory = *new Memory;  // never destroyed: other threads outlive exit
  return Editor(memory, prompt, complete).read(line);
}
