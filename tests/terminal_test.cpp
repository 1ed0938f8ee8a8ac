// A person at a terminal: the keys, what is run, what is shown, and the terminal's settings.

#include <gtest/gtest.h>

#include <csignal>

#include "fuzz/Typist.h"

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
      {"\033\033[Def\033[1;2D\033[1;2C\033[D\004", "e"},
      {"one two three\027\027\031\031", "one two threetwo three"},
      {"one two\001\033d\033[3;5~x\031", "xone two"},
      {"a b\033\177\033\010c", "c"},
      {"ae\xCC\x81\xE4\xB8\x96\002\002b\005\010", "abe\xCC\x81"},
      {"\xFF\xC3\xA9\xC2\x85\xED\xA0\x80z\xE9", "\xFF\xC3\xA9\xC2\x85\xED\xA0\x80z\xE9",
       "> \xEF\xBF\xBD\xC3\xA9\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBDz\xEF\xBF\xBD"},
      {std::string("\0\037\033[15~\033[1;2P\033OP\033[[A\033[<0;3;4M\033[M !!\033x\033\xC3\xA9n",
                   41),
       "n"},
      {"\033[A2", "n2"},
      {"\033[A\020x\033[B\016\020\033[A", "nx"},
      {"  ", "  ", ">"},
      {"ab\022x\007", "ab"},
      {"\022n\022\033[Fy", "n2y"},
      {"\022zz\010\010x", "nx"},
      {"a\033[200~1\tb\r2\n3\033[201~\033[200~c\033[201~", "a1 bc"},
      {"\001<", "<2"},
      {"\033[200~4\r5\033[201~\003", "", "> 34^C"},
      {"t T\t\t", "t tar", "> t tar\ntar               tar.gz (smaller)\n> t tar"},
      {"f x/\t", "f x/", "> f x/\n\xEF\xBF\xBD\xC3\xA9  \xC3\xA8\n> f x/"},
      {"f y\tz", "f y/z"},
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
  EXPECT_EQ(typist.before.find("\r\033[J"), std::string::npos) << "tmux would keep what is cleared";
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
    const auto profile = "log-end = never\ndump-timestamp = T\ndump-delay = " + delay;
    program.emplace(Start{.profile = profile, .onTerminal = true, .term = term, .shell = shell});
    read(kPrompt);
  }

  void read(const std::string& end) { printed += program->readUntil(end); }

  void expectEnd(const std::string& out, int status) {
    const auto outcome = program->finish();
    EXPECT_EQ(outcome.out, out);
    EXPECT_EQ(outcome.status, status);
  }

  /// As Ctrl-S does.
  void stopOutput() {
    const int side = open(ptsname(program->terminal()), O_RDWR | O_NOCTTY | O_CLOEXEC);
    EXPECT_EQ(tcflow(side, TCOOFF), 0);
    close(side);
  }

  std::optional<Program> program;
  std::string printed;
};

TEST_F(Terminal, IsAsItWasWhileACommandRuns) {
  start("linux", "2500");  // milliseconds, in which it says that it runs
  program->type(kTel + "a\r");
  read("running 0:01");
  EXPECT_TRUE(isAsItWas(program->terminal()));
  program->type(kTel + "b\r\004");  // which is kept for the prompts
  read(kPrompt);
  read(kPrompt);
  EXPECT_EQ(shown(printed), shownFor(kTel + "a") + shownFor(kTel + "b") + "(/zubtool)>>");
  expectEnd("\033[?2004l", 1);
}

TEST_F(Terminal, ShowsNothingOfWorkThatASignalEndsOrThatWritesToIt) {
  for (const bool isStopped : {false, true}) {
    start("vt100", "60000");
    program->type(kTel + "a\r");
    read("running 0:01\033[K");
    if (isStopped) stopOutput();
    kill(program->pid(), SIGTERM);
    expectEnd(isStopped ? "" : "\r\033[K", 1000 + SIGTERM);
  }
  start("linux", "0");
  program->type("logdump oslog 600 /dev/tty\r");
  read("bars\n");
  sleep(2);  // in which it would be shown among the lines
  kill(program->pid(), SIGTERM);
  expectEnd("", 1000 + SIGTERM);
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
