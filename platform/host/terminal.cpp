// Line editing with libedit; editline(3) describes its interface, editrc(5) its functions by name.

#include "platform/terminal.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <clocale>
#include <cstdio>
#include <cwchar>
#include <cwctype>
#include <string_view>
#include <vector>

#include "platform/host/Libedit.h"
#include "platform/host/TerminalSession.h"
#include "platform/host/WideText.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/Utf8.h"

namespace {

using host::TerminalSession;
using host::toBytes;
using host::toWide;

constexpr int kHistory = 1000;       // lines
constexpr int kRestOfSequence = 50;  // milliseconds for the next byte of a character

constexpr wchar_t kCtrlR = L'\x12';
constexpr auto kSearchKey = L"\x1F";  // Ctrl-_

/// Keys that libedit binds to something else, or to nothing.
constexpr struct {
  const wchar_t* key;
  const wchar_t* function;
} kKeys[] = {
    {L"^I", L"zub-complete"},        {L"^D", L"zub-delete-or-end"},
    {L"^R", L"zub-search"},          {kSearchKey, L"em-inc-search-prev"},
    {L"^W", L"ed-delete-prev-word"}, {L"\\e[1;5C", L"em-next-word"},
    {L"\\e[1;5D", L"ed-prev-word"},  {L"\\e[1~", L"ed-move-to-beg"},
    {L"\\e[7~", L"ed-move-to-beg"},  {L"\\e[4~", L"ed-move-to-end"},
    {L"\\e[8~", L"ed-move-to-end"},  {L"\\e[3~", L"ed-delete-next-char"},
    {L"\\e[1;3C", L"em-next-word"},  {L"\\e[1;3D", L"ed-prev-word"},
    {L"\\e[1;2C", L"ed-next-char"},  {L"\\e[1;2D", L"ed-prev-char"},
    {L"\\e[2~", L"ed-unassigned"},   {L"\\e[5~", L"ed-unassigned"},
    {L"\\e[6~", L"ed-unassigned"},   {L"\\ex", L"ed-unassigned"},
    {L"\\eX", L"ed-unassigned"},     {L"^@", L"ed-unassigned"},
};

/// Gives the calling thread the character types of UTF-8 while this lives. What is printable and
/// how wide is all that it decides: what is typed never goes through a locale.
class Utf8Types {
 public:
  Utf8Types() {
    static const locale_t utf8 = newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
    before = uselocale(utf8);  // a null one changes nothing
  }
  Utf8Types(const Utf8Types&) = delete;
  Utf8Types& operator=(const Utf8Types&) = delete;
  ~Utf8Types() { uselocale(before); }

 private:
  locale_t before;
};

/// How many columns `text` takes on the screen, as libedit shows it.
std::size_t widthOf(std::wstring_view text) {
  std::size_t width = 0;
  for (const wchar_t character : text) {
    if (character == L'\t') {
      width = (width / 8 + 1) * 8;
    } else if (std::iswcntrl(static_cast<wint_t>(character)) != 0) {
      width += 2;  // ^A
    } else if (const int columns = wcwidth(character); columns >= 0) {
      width += static_cast<std::size_t>(std::max(columns, 1));
    } else {
      width += 7;  // \U+DC80
    }
  }
  return width;
}

winsize sizeOfTerminal() {
  winsize size{};
  ioctl(STDOUT_FILENO, TIOCGWINSZ, &size);
  if (size.ws_col == 0) size.ws_col = 80;
  if (size.ws_row == 0) size.ws_row = 24;
  return size;
}

using Candidates = std::map<std::string, std::string>;

/// What `words` have in common at their start.
std::string commonStart(const Candidates& words) {
  std::string common = words.begin()->first;
  for (const auto& [word, note] : words) {
    common.erase(std::ranges::mismatch(common, word).in1, common.end());
  }
  return common;
}

/// The part of a candidate that a list of them shows: of a path, its last element.
std::wstring label(const std::string& candidate) {
  const auto slash = candidate.rfind('/', candidate.size() - 2);
  auto text = toWide(candidate.substr(slash == std::string::npos ? 0 : slash + 1));
  const auto isHidden = [](wchar_t c) { return std::iswprint(static_cast<wint_t>(c)) == 0; };
  std::ranges::replace_if(text, isHidden, L'?');
  return text;
}

/// The one editor of the process, which is made once and never destroyed: it is used on one thread
/// while another one may call exit(3).
class Editor {
 public:
  /// Null where there is nothing to edit on.
  static Editor* shared();

  bool read(const std::string& prompt, const platform::LineCompleter& complete, std::string& line);

 private:
  /// How many row ends there are up to the cursor, and up to the end of the line.
  struct Rows {
    std::size_t toCursor = 0;
    std::size_t all = 0;
  };

  Editor();

  int readCharacter(wchar_t& character);
  TerminalSession::Event waitForInput(int milliseconds);
  bool readByte();
  unsigned char deleteOrEnd();
  unsigned char search();
  void followSearch();
  unsigned char completeWord();
  unsigned char list(const Candidates& candidates);
  Rows rowsOfLine() const;
  std::wstring toCursor() const;
  std::wstring fromCursor() const;
  void redraw(bool isUnmoved);

  const host::Libedit lib;
  EditLine* edit = nullptr;
  HistoryW* history = nullptr;
  TerminalSession* session = nullptr;                  // while a line is read
  const platform::LineCompleter* completer = nullptr;  // likewise
  std::wstring shownPrompt;
  std::string sequence;   // bytes of a character that is not complete
  std::wstring received;  // characters that libedit has not asked for yet
  bool isSearching = false;
};

/// Opens the library on the terminal, unless it does not know that kind of terminal.
Editor::Editor() {
  if (!lib.isThere()) return;
  std::FILE* const complaints = std::fopen("/dev/null", "we");
  if (complaints == nullptr) return;
  edit = lib.el_init("zubtool", stdin, stdout, complaints);
  int isEditing = 0;
  if (edit == nullptr || lib.el_set(edit, EL_TERMINAL, nullptr) != 0 ||
      lib.el_get(edit, EL_EDITMODE, &isEditing) != 0 || isEditing == 0) {
    return;  // without el_end, which would throw away what has been typed ahead
  }
  history = lib.history_winit();
  if (history == nullptr) return;
  HistEventW event;
  lib.history_w(history, &event, H_SETSIZE, kHistory);
  lib.history_w(history, &event, H_SETUNIQUE, 1);
  // Its use of a terminal that inserts loses text where a line has several rows.
  for (const auto* const capability : {L"ic", L"im", L"IC"}) {
    lib.el_wset(edit, EL_SETTC, capability, L"", nullptr);
  }
  lib.el_wset(edit, EL_EDITOR, L"emacs");
  lib.el_wset(edit, EL_HIST, lib.history_w, history);
  const auto showPrompt = +[](EditLine*) { return shared()->shownPrompt.data(); };
  lib.el_wset(edit, EL_PROMPT, showPrompt);
  lib.el_wset(
      edit, EL_GETCFN,
      +[](EditLine*, wchar_t* character) { return shared()->readCharacter(*character); });
  lib.el_wset(
      edit, EL_ADDFN, L"zub-complete", L"Complete the word",
      +[](EditLine*, wint_t) { return shared()->completeWord(); });
  lib.el_wset(
      edit, EL_ADDFN, L"zub-search", L"Search the history",
      +[](EditLine*, wint_t) { return shared()->search(); });
  lib.el_wset(
      edit, EL_ADDFN, L"zub-delete-or-end", L"Delete a character, or end the input",
      +[](EditLine*, wint_t) { return shared()->deleteOrEnd(); });
  for (const auto& [key, function] : kKeys) lib.el_wset(edit, EL_BIND, key, function, nullptr);
}

Editor* Editor::shared() {
  static Editor* const editor = []() -> Editor* {
    if (isatty(STDIN_FILENO) == 0 || isatty(STDOUT_FILENO) == 0) return nullptr;
    const char* const kind = std::getenv("TERM");
    if (kind == nullptr || std::string_view(kind) == "dumb" || *kind == '\0') return nullptr;
    const Utf8Types types;
    const TerminalSession session;  // el_init changes the terminal's settings
    return new Editor;
  }();
  return editor != nullptr && editor->history != nullptr ? editor : nullptr;
}

bool Editor::read(const std::string& prompt, const platform::LineCompleter& complete,
                  std::string& line) {
  const Utf8Types types;
  TerminalSession now;
  session = &now;
  completer = &complete;
  shownPrompt = toWide(prompt);
  lib.el_set(edit, EL_PREP_TERM, 1);  // before the prompt shows, so that no key is echoed twice
  int length = 0;
  const wchar_t* const text = lib.el_wgets(edit, &length);
  if (text == nullptr) return false;
  std::wstring typed(text, static_cast<std::size_t>(length));
  if (typed.ends_with(L'\n')) typed.pop_back();
  line = toBytes(typed);
  HistEventW event;
  if (line.find_first_not_of(" \t") != std::string::npos) {
    lib.history_w(history, &event, H_ENTER, typed.c_str());
  }
  return true;
}

/// For libedit: 1 for a character, 0 for the end of the input.
int Editor::readCharacter(wchar_t& character) {
  while (received.empty()) {
    waitForInput(-1);
    if (!readByte()) return 0;
    while (sequence.size() < posix::utf8Length(sequence[0]) && (sequence.back() & 0x80) != 0 &&
           waitForInput(kRestOfSequence) == TerminalSession::Event::input && readByte()) {
    }
    received = toWide(sequence);
    sequence.clear();
  }
  if (isSearching) followSearch();
  character = received.front();
  received.erase(0, 1);
  return 1;
}

/// Waits, and draws the line anew whenever something has happened to the screen.
TerminalSession::Event Editor::waitForInput(int milliseconds) {
  for (;;) {
    const auto event = session->wait(milliseconds);
    using enum TerminalSession::Event;
    if (event == input || event == timeout) return event;
    redraw(event == resized);
  }
}

/// Reads one byte, and no more: what follows the line may be for another program.
bool Editor::readByte() {
  char byte = 0;
  if (posix::readSome(STDIN_FILENO, &byte, 1) != 1) return false;
  sequence += byte;
  return true;
}

/// In the rows of a terminal as wide as it is now.
Editor::Rows Editor::rowsOfLine() const {
  const auto columns = sizeOfTerminal().ws_col;
  return {widthOf(shownPrompt + toCursor()) / columns,
          widthOf(shownPrompt + toCursor() + fromCursor()) / columns};
}

std::wstring Editor::toCursor() const {
  const LineInfoW& line = *lib.el_wline(edit);
  return {line.buffer, line.cursor};
}

std::wstring Editor::fromCursor() const {
  const LineInfoW& line = *lib.el_wline(edit);
  return {line.cursor, line.lastchar};
}

/// Draws prompt and line where they start: above the cursor, as far as a terminal that breaks its
/// lines anew has put it, or in the cursor's own row. It clears row by row: some terminals take a
/// clear screen for a page to keep.
void Editor::redraw(bool isUnmoved) {
  lib.el_resize(edit);
  auto rows = isUnmoved ? rowsOfLine() : Rows{};
  std::fputs(('\r' + std::string(rows.all - rows.toCursor, '\n')).c_str(), stdout);
  for (; rows.all > 0; --rows.all) {
    lib.el_wset(edit, EL_ECHOTC, L"ce", nullptr);
    lib.el_wset(edit, EL_ECHOTC, L"up", nullptr);
  }
  lib.el_wset(edit, EL_ECHOTC, L"ce", nullptr);
  lib.el_wset(edit, EL_REFRESH);
}

/// Ctrl-R. libedit's own function behind another key, so that what is typed can be followed.
unsigned char Editor::search() {
  isSearching = true;
  lib.el_wpush(edit, kSearchKey);
  return CC_NORM;
}

/// While the history is searched, libedit takes the escape of a key such as an arrow for a key of
/// its own, which ends the search; then another one has to start the sequence.
void Editor::followSearch() {
  constexpr wchar_t kEscape = L'\033';
  constexpr wchar_t kCtrlG = L'\a';
  constexpr std::wstring_view kGoOn = L"\x08\x7F\x17";  // Ctrl-H, Delete, Ctrl-W
  wchar_t& next = received.front();
  if (next == kCtrlR) {
    next = kSearchKey[0];
  } else if (next == kEscape) {
    isSearching = false;
    if (waitForInput(kRestOfSequence) == TerminalSession::Event::input) received += kEscape;
  } else if (next == kCtrlG) {
    isSearching = false;
    received += kCtrlG;  // where nothing was found, the first only takes back what was not
  } else if (next < L' ' && kGoOn.find(next) == std::wstring_view::npos) {
    isSearching = false;
  }
}

/// Ctrl-D. libedit's own function would print it at the end of the input.
unsigned char Editor::deleteOrEnd() {
  if (!fromCursor().empty()) {
    lib.el_cursor(edit, 1);
    lib.el_deletestr(edit, 1);
    return CC_REFRESH;
  }
  return toCursor().empty() ? CC_EOF : CC_ERROR;
}

/// Tab. Extends the word as far as all candidates agree; where that is no further, lists them.
unsigned char Editor::completeWord() {
  const auto typed = toBytes(toCursor());
  const auto candidates = (*completer)(typed);
  if (candidates.empty()) return CC_ERROR;
  auto common = commonStart(candidates);
  const bool isWhole = candidates.size() == 1 && !common.ends_with('/');
  const auto start = typed.find_last_of(" \t\v\f\r") + 1;
  common.erase(0, typed.size() - start);
  if (isWhole) common += ' ';
  if (common.empty()) return list(candidates);
  return lib.el_winsertstr(edit, toWide(common).c_str()) == 0 ? CC_REFRESH : CC_ERROR;
}

/// Lists the candidates under the line, as many as the screen holds.
unsigned char Editor::list(const Candidates& candidates) {
  const auto size = sizeOfTerminal();
  const auto rows = rowsOfLine();
  std::string text(rows.all - rows.toCursor + 1, '\n');
  std::vector<std::wstring> labels;
  std::size_t widest = 0;
  for (const auto& [candidate, note] : candidates) {
    const auto shownNote = note.empty() ? "" : " (" + note + ')';
    labels.push_back(label(candidate) + toWide(shownNote));
    widest = std::max(widest, widthOf(labels.back()) + 2);
  }
  const std::size_t columns = std::max<std::size_t>(1, size.ws_col / widest);
  const std::size_t shown =
      std::min(labels.size(), columns * (size.ws_row > 4 ? size.ws_row - 3U : 1U));
  for (std::size_t i = 0; i < shown; ++i) {
    const bool isLast = (i + 1) % columns == 0 || i + 1 == shown;
    text += toBytes(labels[i]);
    text += isLast ? "\n" : std::string(widest - widthOf(labels[i]), ' ');
  }
  if (shown < labels.size()) text += "... " + std::to_string(labels.size() - shown) + " more\n";
  std::fputs(text.c_str(), stdout);
  lib.el_wset(edit, EL_REFRESH);
  return CC_NORM;
}

}  // namespace

std::optional<bool> platform::readEditedLine(const std::string& prompt,
                                             const LineCompleter& complete, std::string& line) {
  Editor* const editor = Editor::shared();
  if (editor == nullptr) return std::nullopt;
  return editor->read(prompt, complete, line);
}
