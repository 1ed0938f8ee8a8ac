// A person at a terminal: the keys, what is run, what is shown, and the terminal's settings.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pty.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <iostream>
#include <random>
#include <sstream>
#include <tuple>

#include "platform/terminal.h"
#include "tests/Program.h"

namespace {

const std::string kPrompt = "(/zubtool)>> ";
const std::string kTel = "logdump tel ";
const std::string kPath = "/private/var/wireless/Library/Logs/CrashVault/Baseband/log-bb-T.tar.gz";

/// What it shows for a line that collects, with the line.
std::string shownFor(const std::string& line) {
  return kPrompt + line + "\nTelephony log collection: Success\nPath = " + kPath + '\n';
}

/// The rows that a terminal shows of `bytes`, as far as the line editor goes. A character is a
/// byte; a row that is full runs on in the next.
std::string shown(const std::string& bytes, std::size_t columns = 80) {
  std::string cells(1600, ' ');
  std::size_t cursor = 0;
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    const auto row = cursor - cursor % columns;
    if (bytes[i] == '\r' || bytes[i] == '\n') {
      cursor = row + (bytes[i] == '\n' ? columns : 0);
    } else if (bytes[i] != '\033') {
      cells.at(cursor++) = bytes[i];
    } else {
      const auto count = std::max(1UL, std::strtoul(&bytes[i + 2], nullptr, 10));
      i = bytes.find_first_not_of("[?0123456789;", i + 1);
      EXPECT_NE(std::string("ABCHJKhlm").find(bytes[i]), std::string::npos) << bytes[i];
      if (bytes[i] == 'A') cursor -= count * columns;
      if (bytes[i] == 'B') cursor += count * columns;
      if (bytes[i] == 'C') cursor += count;
      if (bytes[i] == 'H') cursor = 0;
      if (bytes[i] == 'J') std::fill(cells.begin() + static_cast<long>(cursor), cells.end(), ' ');
      if (bytes[i] == 'K')
        cells.replace(cursor, row + columns - cursor, row + columns - cursor, ' ');
    }
  }
  std::string text;
  for (std::size_t i = 0; i < cells.size(); i += columns) {
    text += cells.substr(i, columns);
    if (text.back() == ' ') text = text.substr(0, text.find_last_not_of(' ') + 1) + '\n';
  }
  return text.substr(0, text.find_last_not_of('\n') + 1);
}

/// Whether the settings of a terminal are those it had before the program began.
bool isAsItWas(int terminal) {
  termios now{};
  tcgetattr(terminal, &now);
  const auto before = Program::terminalBefore();
  return now.c_iflag == before.c_iflag && now.c_oflag == before.c_oflag &&
         now.c_lflag == before.c_lflag && std::ranges::equal(now.c_cc, before.c_cc);
}

/// A person who types at a terminal on which a process reads lines, and does nothing else.
class Typist {
 public:
  Typist(const char* term, winsize size) {
    const termios settings = Program::terminalBefore();
    int lines[2];
    if (pipe2(lines, O_CLOEXEC) != 0) throw std::bad_alloc();
    process = forkpty(&terminal, nullptr, &settings, &size);
    if (process == 0) readLines(term, lines[1]);
    close(lines[1]);
    arriving = lines[0];
    fcntl(terminal, F_SETFL, O_NONBLOCK);
  }
  Typist(const Typist&) = delete;
  Typist& operator=(const Typist&) = delete;
  ~Typist() { close(terminal); }

  /// Types `keys` once a line is edited.
  void type(std::string keys) {
    await("\033[?2004h");
    while (!keys.empty()) {
      const auto size = write(terminal, keys.data(), std::min<std::size_t>(keys.size(), 200));
      if (size > 0) keys.erase(0, static_cast<std::size_t>(size));
      look();
    }
  }

  /// Where `mark` is in what is printed.
  std::size_t await(const std::string& mark) {
    while (printed.find(mark) == std::string::npos) look();
    return printed.find(mark);
  }

  /// The line that arrives next, and what is shown until then.
  std::string line() {
    std::size_t size = 0;
    for (pollfd ready = {arriving, POLLIN, 0}; poll(&ready, 1, 0) == 0;) look();
    if (read(arriving, &size, sizeof size) != sizeof size) return "no line";
    std::string text(size, ' ');
    for (std::size_t done = 0; done < size;) {
      done += static_cast<std::size_t>(read(arriving, &text[done], size - done));
    }
    before = printed.substr(0, await("\033[?2004l"));
    printed.erase(0, before.size() + 1);
    return text;
  }

  /// How the process has ended; its exit status, or 1000 and the signal that ended it.
  int ended() {
    int status = 0;
    while (waitpid(process, &status, WNOHANG) == 0) look();
    return WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
  }

  pid_t process;
  int terminal = -1;
  std::string before;  // what the last line showed

 private:
  [[noreturn]] static void readLines(const char* term, int lines) {
    setenv("TERM", term, 1);
    const auto complete = [](const std::string& typed) -> std::map<std::string, std::string> {
      if (typed == "t T" || typed == "t tar") return {{"tar", ""}, {"tar.gz", "smaller"}};
      if (typed == "f x/") return {{"x/\033\xC3\xA9", ""}, {"x/\xC3\xA8", ""}};
      if (typed == "f y") return {{"y/", ""}};
      return {};
    };
    for (;;) {
      std::string line;
      if (!platform::readEditedLine("> ", complete, line).value()) _exit(7);
      const auto size = line.size();
      std::ignore = write(lines, &size, sizeof size);
      std::ignore = write(lines, line.data(), size);
    }
  }

  /// Takes what is printed, of which there is more soon.
  void look() {
    char bytes[4096];
    pollfd ready = {terminal, POLLIN, 0};
    poll(&ready, 1, 1);
    const auto size = read(terminal, bytes, sizeof bytes);
    if (size > 0) printed.append(bytes, static_cast<std::size_t>(size));
  }

  int arriving = -1;
  std::string printed;
};

constexpr winsize kUsual = {.ws_row = 24, .ws_col = 80, .ws_xpixel = 0, .ws_ypixel = 0};

TEST(EditedLine, IsWhatTheKeysMakeOfIt) {
  const struct {
    std::string keys;
    std::string line;
    std::string shown = "> " + line;
  } cases[] = {
      {"ac\033[Db", "abc"},
      {"b d\001a\005e\002\006f", "ab def"},
      {"b\033[1~a\033[4~c\033OHx\033OFy\033[7~<\033[8~>", "<xabcy>"},
      {"one two\033[1;5D\033[1;3D1 \033[1;5C2\033b\033f3", "1 one23 two"},
      {"abc\010\177\033[D\033[3~z", "z"},
      {"\033\033[Def\033[1;2D\033[1;2C\033[D\004", "e"},
      {"one two three\027\027\031\031", "one two threetwo three"},
      {"one two\001\033d\033[3;5~x\031", "xone two"},
      {"abc d\025e\031\002\002\013f", "eabcf"},
      {"a b\033\177\033\010c", "c"},
      {"\024ab\024\002\024", "ab"},
      {"ae\xCC\x81\xE4\xB8\x96\002\002b\005\010", "abe\xCC\x81"},
      {"\xFF\xC3\xA9\xC2\x85\xED\xA0\x80z\xE9", "\xFF\xC3\xA9\xC2\x85\xED\xA0\x80z\xE9",
       "> \xEF\xBF\xBD\xC3\xA9\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBDz\xEF\xBF\xBD"},
      {std::string("\0\037\033[15~\033[1;2P\033OP\033[[A\033[<0;3;4M\033[M !!\033x\033\xC3\xA9n",
                   41),
       "n"},
      {"\033[A2", "n2"},
      {"\033[A\033[Ax\033[B\033[A", "nx"},
      {"\033[A\033[A\020\016\020", "n"},
      {"  ", "  ", ">"},
      {"\033[A\033[B\033[B\033[A", "n"},
      {"ab\022x\007", "ab"},
      {"\022n\022\022\033[Fy", "n2y"},
      {"\022zz\010\010x", "nx"},
      {"a\033[200~1\tb\r2\n3\033[201~c", "a1 bc"},
      {"\001<", "<2"},
      {"\033[200~4\r5\033[201~\003", "", "> 34^C"},
      {"t T\t\t", "t tar", "> t tar\ntar               tar.gz (smaller)\n> t tar"},
      {"f x/\t", "f x/", "> f x/\n\xEF\xBF\xBD\xC3\xA9  \xC3\xA8\n> f x/"},
      {"f y\tz", "f y/z"},
      {"q\tx\014y", "qxy"},
  };
  Typist typist("xterm-256color", kUsual);
  for (const auto& [keys, line, display] : cases) {
    typist.type(keys + (keys.ends_with('\003') ? "" : "\r"));
    EXPECT_EQ(typist.line(), line);
    EXPECT_EQ(shown(typist.before), display);
  }
  typist.type("\004");
  EXPECT_EQ(typist.ended(), 7);
}

TEST(EditedLine, HoldsAsMuchAsIsTyped) {
  Typist typist("screen-256color", kUsual);
  const std::string text(20'000, 'x');
  typist.type(text + "\001" + text + "\033[200~" + text + "\033[201~\r");
  EXPECT_EQ(typist.line(), text + text + text);
}

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

TEST(EditedLine, IsDrawnAnewWhenTheTerminalHasAnotherSize) {
  Typist typist("xterm-256color", kUsual);
  const std::string text(75, 'r');
  typist.type(text);
  typist.await(text);
  const winsize narrow = {.ws_row = 6, .ws_col = 30, .ws_xpixel = 0, .ws_ypixel = 0};
  ioctl(typist.terminal, TIOCSWINSZ, &narrow);
  typist.type("z\001t T\b \005\r");
  EXPECT_EQ(typist.line(), "t  " + text + 'z');
  EXPECT_EQ(shown(typist.before, 30), "> t  " + text + 'z');
}

TEST(EditedLine, LeavesTheTerminalAsItWasWhateverSignalEndsIt) {
  for (const int signal : {SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGUSR1, SIGALRM, SIGXCPU, SIGIO,
                           SIGPWR, SIGSTKFLT, SIGRTMIN, SIGRTMAX}) {
    Typist typist("linux", kUsual);
    for (const int waking : {SIGWINCH, SIGCONT}) kill(typist.process, waking);
    typist.type("x");
    for (const int sent : {SIGSTOP, signal, SIGCONT}) kill(typist.process, sent);
    EXPECT_EQ(typist.ended(), 1000 + signal);
    EXPECT_TRUE(isAsItWas(typist.terminal)) << signal;
  }
}

/// The program at its prompt, where lines are edited.
class Terminal : public testing::Test {
 protected:
  void start(const std::string& term, const std::string& delay, const std::string& shell = "") {
    const auto profile = "dump-timestamp = T\ndump-delay = " + delay;
    program.emplace(Start{.profile = profile, .onTerminal = true, .term = term, .shell = shell});
    read(kPrompt);
  }

  void read(const std::string& end) { printed += program->readUntil(end); }

  void expectEnd(const std::string& out, int status) {
    const auto outcome = program->finish();
    EXPECT_EQ(outcome.out, out);
    EXPECT_EQ(outcome.status, status);
  }

  std::optional<Program> program;
  std::string printed;
};

TEST_F(Terminal, IsAsItWasWhileACommandRuns) {
  start("linux", "1500");  // milliseconds, in which it says that it runs
  program->type(kTel + "a\r");
  read("running 0:01");
  EXPECT_TRUE(isAsItWas(program->terminal()));
  program->type(kTel + "b\r\004");  // which is kept for the prompts
  read(kPrompt);
  read(kPrompt);
  EXPECT_EQ(shown(printed), shownFor(kTel + "a") + shownFor(kTel + "b") + "(/zubtool)>>");
  expectEnd("\033[?2004l", 1);
}

TEST_F(Terminal, ShowsNothingOfWorkThatASignalEnds) {
  start("vt100", "60000");
  program->type(kTel + "a\r");
  read("running 0:01\033[K");
  kill(program->pid(), SIGTERM);
  expectEnd("\r\033[K", 1000 + SIGTERM);
}

TEST_F(Terminal, IsAsItWasWhileTheProgramIsStopped) {
  const auto line = kTel + std::string(100, 'r') + 'z';
  start("xterm-256color", "0", R"("$@"; echo; echo stopped; read -r line; fg >/dev/null)");
  program->type(line);
  read("rz");
  program->type("\032");
  read("stopped\n");
  EXPECT_TRUE(isAsItWas(program->terminal()));
  program->type("\n");
  read("rz");
  program->type("b\r");
  read(kPath);  // likewise
  read(kPrompt);
  EXPECT_EQ(shown(printed), kPrompt + line + "\nstopped\n" + shownFor(line + 'b') + "(/zubtool)>>");
}

TEST_F(Terminal, IsReadAsBeforeWhereItsCursorDoesNotMove) {
  for (const std::string term : {"dumb", ""}) {
    start(term, "0");
    EXPECT_TRUE(isAsItWas(program->terminal())) << term;
    program->type("quit\n");
    expectEnd("", 0);
  }
}

}  // namespace
