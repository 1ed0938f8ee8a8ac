// A person at a terminal: the keys, what is run, what is shown, and the terminal's settings.

#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <termios.h>

#include <csignal>

#include "tests/Program.h"

namespace {

const std::string kPrompt = "(/zubtool)>> ";
const std::string kTel = "logdump tel ";
const std::string kPath = "/private/var/wireless/Library/Logs/CrashVault/Baseband/log-bb-T.tar.gz";

/// What it asks for collections with these `reasons`.
std::string requestsOf(const std::vector<std::string>& reasons) {
  std::string requests;
  for (const auto& reason : reasons) {
    requests +=
        "GetTraceProperty {TraceName=\"TraceSystemLogs\", TracePropertyName=\"TraceMode\"}\n"
        "TraceDumpState {TraceAction=\"CollectTelephonyLogs\", TraceDumpStateReason=\"[zubtool] " +
        reason + "\", TraceDumpStatePerformCompression=1}\n";
  }
  return requests;
}

/// What it shows for a line that collects, with the line.
std::string shownFor(const std::string& line) {
  return kPrompt + line + "\nTelephony log collection: Success\nPath = " + kPath + '\n';
}

/// What a terminal such as xterm shows, as far as the line editor goes; it never scrolls. A
/// character is a byte, and one in the last column is never followed by a line end.
struct Screen {
  void print(const std::string& bytes) {
    for (std::size_t i = 0; i < bytes.size(); ++i) {
      if (bytes.compare(i, 2, "\033[") == 0) {
        const auto end = bytes.find_first_not_of("0123456789;", i + 2);
        control(bytes.at(end), std::max(1UL, std::strtoul(&bytes[i + 2], nullptr, 10)));
        i = end;
      } else if (bytes[i] == '\r' || bytes[i] == '\n') {
        cursor = row() + (bytes[i] == '\n' ? columns : 0);
      } else if (bytes[i] == '\b') {
        --cursor;
      } else if (bytes[i] != '\a') {
        cells.at(cursor++) = bytes[i];
      }
    }
  }

  void control(char function, std::size_t count) {
    EXPECT_NE(std::string("ACGHJKPm").find(function), std::string::npos) << function;
    const auto end = function == 'J' ? cells.size() : row() + columns;
    if (function == 'A') cursor -= count * columns;
    if (function == 'C') cursor += count;
    if (function == 'G') cursor = row() + count - 1;
    if (function == 'H') cursor = 0;
    if (function == 'J' || function == 'K') cells.replace(cursor, end - cursor, end - cursor, ' ');
    if (function == 'P') cells.insert(end, count, ' ').erase(cursor, count);
  }

  /// Its lines, without the blanks at their ends. One that fills a row runs on in the next.
  std::string text() const {
    std::string text;
    for (std::size_t i = 0; i < cells.size(); i += columns) {
      text += cells.substr(i, columns);
      if (text.back() != ' ') continue;
      text.resize(text.find_last_not_of(' ') + 1);
      text += '\n';
    }
    return text.substr(0, text.find_last_not_of('\n') + 1);
  }

  std::size_t row() const { return cursor - cursor % columns; }

  std::size_t columns = 80;
  std::string cells = std::string(20 * columns, ' ');
  std::size_t cursor = 0;
};

std::vector<tcflag_t> settingsOf(const termios& terminal) {
  return {terminal.c_iflag, terminal.c_oflag, terminal.c_lflag, terminal.c_cc[VMIN],
          terminal.c_cc[VTIME]};
}

/// Whether the settings of a terminal are those it had before the program began.
bool isAsItWas(int terminal) {
  termios now{};
  tcgetattr(terminal, &now);
  return settingsOf(now) == settingsOf(Program::terminalBefore());
}

/// The program at its prompt, and the screen in front of it.
class Terminal : public testing::Test {
 protected:
  void start(const Start& how) {
    program.emplace(how);
    show(kPrompt);
  }

  /// Starts it where lines are edited.
  void SetUp() override {
    start({.profile = kProfile, .onTerminal = true, .term = "xterm-256color"});
#ifndef ZUB_EDITS_LINES
    GTEST_SKIP() << "no line editing in this build";
#endif
  }

  /// Shows what is printed up to and with `end`, `times` times.
  void show(const std::string& end, int times = 1) {
    for (; times > 0; --times) screen.print(program->readUntil(end));
  }

  /// Ends the input, of which nothing may show.
  void expectRequests(const std::vector<std::string>& reasons) {
    program->type("\004");
    expectOutcome(program->finish(), {.status = 1, .requests = requestsOf(reasons)});
  }

  const std::string kProfile = "dump-timestamp = T\ndump-delay = 50\n";
  std::optional<Program> program;
  Screen screen;
};

TEST_F(Terminal, EditsLinesAndRunsWhatTheyBecome) {
  const std::string rows = "1" + std::string(70, '2') + std::string(80, '3') + "4";
  const std::string offered = "bb     cd     core   help   oslog  tel\n";
  const struct {
    std::string keys;
    std::vector<std::string> reasons;
    int prompts = 1;         // that show after the keys
    std::string above = {};  // shown besides
  } cases[] = {
      {kTel + "ac\033[Db\r", {"abc"}},                                 // left
      {"tel x\033[Hlogdump \r", {"x"}},                                // to the start
      {rows + "\001" + kTel + "\r", {rows}},                           // of many rows
      {"tel ac\033[7~logdump \033[8~\033[1;5Db\033[4~d\r", {"bacd"}},  // other terminals'
      {"Xlogdump t e\033[1~\033[3~\033[1;5C\033[1;5Cel\r", {"e"}},     // keys
      {kTel + "\033[2~\033[5~\033[6~\033x\033Xn\r", {"n"}},            // and without use
      {kTel + "ef\033[D\004\r", {"e"}},                                // a character less
      {kTel + "nonui\027\xC3\xA9\r", {"\xC3\xA9"}},                    // a word less
      {kTel + "u\r" + kTel + "v\r" + kTel + "v\r\033[A\033[Aw\r", {"u", "v", "v", "uw"}, 4},
      {" \r\033[A2\r", {"uw2"}, 2, "(/zubtool)>>\n"},                    // the line before
      {"\0222x\010\022\033[D\r", {rows}},                                // a search
      {kTel + "a\rlogdump tel b\r", {"a", "b"}, 2},                      // a paste
      {"lo\tt\tq\r", {"q"}},                                             // sub-command, handler
      {"logdump \ttel d\r", {"d"}, 2, kPrompt + "logdump\n" + offered},  // a list
      {"logdump \t\014tel c\r", {"c"}, 3},                               // and a clear screen
  };
  std::vector<std::string> all;
  for (const auto& [keys, reasons, prompts, above] : cases) {
    program->type(keys);
    show(kPrompt, prompts);
    auto shown = above;
    for (const auto& reason : reasons) shown += shownFor(kTel + reason);
    EXPECT_EQ(screen.text(), shown + "(/zubtool)>>");
    all.insert(all.end(), reasons.begin(), reasons.end());
    screen = {};
    screen.print(kPrompt);
  }
  expectRequests(all);
}

TEST_F(Terminal, TakesAnyBytesAndAsManyAsAreTyped) {
  const std::string bytes = "\xFF\xC3\xA9\xC2\x85\xED\xA0\x80\x80z\xE9";
  const std::string block(500, 'x');  // the terminal holds 4096 bytes each way
  std::string reason;
  program->type(kTel);
  for (int i = 0; i < 40; ++i, reason += block) {
    program->type(block);
    program->readUntil(std::string(8, 'x'));
  }
  program->type(bytes + "\r");
  program->readUntil(kPrompt);
  expectRequests({reason + bytes});
}

TEST_F(Terminal, IsAsItWasWhileACommandRuns) {
  program->type(kTel + "a\r");
  while (!isAsItWas(program->terminal())) sched_yield();
  program->type(kTel + "b\r");  // which is kept for the prompt
  show(kPrompt, 2);
  EXPECT_EQ(screen.text(), shownFor(kTel + "a") + shownFor(kTel + "b") + "(/zubtool)>>");
  expectRequests({"a", "b"});
}

TEST_F(Terminal, IsDrawnAnewWhenItsSizeChanges) {
  const std::string reason(50, 'r');
  program->type("tel " + reason.substr(1));
  show(reason.substr(1));
  screen.columns = 30;
  const winsize size = {.ws_row = 4, .ws_col = 30, .ws_xpixel = 0, .ws_ypixel = 0};
  ioctl(program->terminal(), TIOCSWINSZ, &size);
  show(kPrompt);
  program->type("r\001logdump \t\r");
  show(kPrompt, 2);
  const std::string list = "bb     cd     core   help\n... 2 more\n";
  EXPECT_EQ(screen.text(),
            kPrompt + kTel + reason + '\n' + list + shownFor(kTel + reason) + "(/zubtool)>>");
  expectRequests({reason});
}

TEST_F(Terminal, IsAsItWasWhileTheProgramIsStopped) {
  const auto reason = std::string(100, 'r') + 'z';
  screen = {};
  start({.profile = kProfile,
         .onTerminal = true,
         .term = "xterm-256color",
         .shell = R"("$@"; echo; echo stopped; read -r line; fg >/dev/null)"});
  program->type(kTel + reason);
  show("rz");
  program->type("\032");
  show("stopped\n");
  EXPECT_TRUE(isAsItWas(program->terminal()));
  program->type("\n");
  show("rz");
  program->type("b\r");
  show(kPath);  // after the line has perhaps been drawn twice
  show(kPrompt);
  EXPECT_EQ(screen.text(), kPrompt + kTel + reason + "\nstopped\n" + shownFor(kTel + reason + 'b') +
                               "(/zubtool)>>");
  expectRequests({reason + 'b'});
}

TEST_F(Terminal, IsAsItWasHoweverTheProgramEnds) {
  for (const int signal : {0, SIGINT, SIGTERM, SIGHUP, SIGQUIT}) {
    const int terminal = dup(program->terminal());
    for (const int waking : {SIGWINCH, SIGCONT}) kill(program->pid(), waking);
    signal == 0 ? program->type("quit\r") : static_cast<void>(kill(program->pid(), signal));
    EXPECT_EQ(program->finish().status, signal == 0 ? 0 : 1000 + signal);
    EXPECT_TRUE(isAsItWas(terminal)) << signal;
    close(terminal);
    start({.onTerminal = true, .term = "xterm-256color"});
  }
}

TEST_F(Terminal, IsReadAsBeforeWhereItsKindIsNotKnown) {
  for (const std::string term : {"dumb", "", "no-such-terminal"}) {
    start({.onTerminal = true, .term = term});
    EXPECT_TRUE(isAsItWas(program->terminal())) << term;
    program->type("quit\n");
    EXPECT_EQ(program->finish().out, "") << term;
  }
}

}  // namespace
