// A person at a terminal: the keys, what is run, what is shown, and the terminal's settings.

#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <termios.h>

#include <csignal>

#include "tests/Program.h"

namespace {

const std::string kPrompt = "(/zubtool)>> ";
const std::string kAtTheEnd = "(/zubtool)>>";
const std::string kTel = "logdump tel ";
const std::string kPath = "/private/var/wireless/Library/Logs/CrashVault/Baseband/log-bb-T.tar.gz";

/// What it shows for a line that collects, with the line.
std::string shownFor(const std::string& line) {
  return kPrompt + line + "\nTelephony log collection: Success\nPath = " + kPath + '\n';
}

/// The lines that a terminal such as xterm shows of `bytes`, as far as the line editor goes. A
/// character is a byte; a line that fills a row runs on in the next.
std::string shown(const std::string& bytes, std::size_t columns = 80) {
  std::string cells(1600, ' ');
  std::size_t cursor = 0;
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    const auto row = cursor - cursor % columns;
    if (bytes[i] == '\r' || bytes[i] == '\n') {
      cursor = row + (bytes[i] == '\n' ? columns : 0);
    } else if (bytes[i] == '\b') {
      --cursor;
    } else if (bytes[i] != '\a' && bytes[i] != '\033') {
      cells.at(cursor++) = bytes[i];
    } else if (bytes[i] == '\033') {
      const auto count = std::max(1UL, std::strtoul(&bytes[i + 2], nullptr, 10));
      i = bytes.find_first_not_of("[0123456789;", i + 1);
      const auto end = bytes[i] == 'J' ? cells.size() : row + columns;
      const std::string blanks(end - cursor, ' ');
      EXPECT_NE(std::string("ACGHJKPm").find(bytes[i]), std::string::npos) << bytes[i];
      if (bytes[i] == 'A') cursor -= count * columns;
      if (bytes[i] == 'C') cursor += count;
      if (bytes[i] == 'G') cursor = row + count - 1;
      if (bytes[i] == 'H') cursor = 0;
      if (bytes[i] == 'J' || bytes[i] == 'K') cells.replace(cursor, blanks.size(), blanks);
      if (bytes[i] == 'P') cells.insert(end, count, ' ').erase(cursor, count);
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
  const auto settingsOf = [](const termios& one) {
    return std::tuple(one.c_iflag, one.c_oflag, one.c_lflag, one.c_cc[VMIN], one.c_cc[VTIME]);
  };
  termios now{};
  tcgetattr(terminal, &now);
  return settingsOf(now) == settingsOf(Program::terminalBefore());
}

/// The program at its prompt, where lines are edited.
class Terminal : public testing::Test {
 protected:
  void SetUp() override {
#ifndef ZUB_EDITS_LINES
    GTEST_SKIP() << "no line editing in this build";
#endif
    start("xterm-256color");
  }

  void start(const std::string& term, const std::string& shell = "", int delay = 50) {
    program.emplace(Start{.profile = "dump-timestamp = T\ndump-delay = " + std::to_string(delay),
                          .onTerminal = true,
                          .term = term,
                          .shell = shell});
    printed.clear();
    read(kPrompt);
  }

  /// Reads what is printed up to and with `end`, `times` times.
  void read(const std::string& end, int times = 1) {
    for (; times > 0; --times) printed += program->readUntil(end);
  }

  /// Ends the input, of which nothing may show.
  void expectRequests(const std::vector<std::string>& reasons) {
    program->type("\004");
    std::string requests;
    for (const auto& reason : reasons) {
      requests +=
          "GetTraceProperty {TraceName=\"TraceSystemLogs\", TracePropertyName=\"TraceMode\"}\n"
          "TraceDumpState {TraceAction=\"CollectTelephonyLogs\", "
          "TraceDumpStateReason=\"[zubtool] " +
          reason + "\", TraceDumpStatePerformCompression=1}\n";
    }
    expectOutcome(program->finish(), {.status = 1, .requests = requests});
  }

  std::optional<Program> program;
  std::string printed;
};

TEST_F(Terminal, EditsLinesAndRunsWhatTheyBecome) {
  const std::string rows = "1" + std::string(70, '2') + std::string(80, '3') + "4";
  const std::string offered =
      "bb                          cd\n"
      "core (resets the baseband)  help\n"
      "oslog                       tel\n";
  const struct {
    std::string keys;
    std::vector<std::string> reasons;
    int prompts = 1;         // that show after the keys
    std::string above = {};  // shown besides
  } cases[] = {
      {kTel + "ac\033[1;3D\033[F\033[1;2D\033[1;2C\033[Db\r", {"abc"}},  // left
      {"tel x\033[Hlogdump \r", {"x"}},                                  // to the start
      {rows + "\001" + kTel + "\r", {rows}},                             // of many rows
      {"tel ac\033[7~logdump \033[8~\033[1;5Db\033[4~d\r", {"bacd"}},    // other terminals'
      {"Xlogdump t e\033[1~\033[3~\033[1;5C\033[1;3Cel\r", {"e"}},       // keys
      {kTel + '\0' + "\033[2~\033[5~\033[6~\033x\033Xn\r", {"n"}},       // and without use
      {kTel + "ef\033[D\004\r", {"e"}},                                  // a character less
      {kTel + "nonui\027\xC3\xA9\r", {"\xC3\xA9"}},                      // a word less
      {kTel + "u\r" + kTel + "v\r" + kTel + "v\r\033[A\033[Aw\r", {"u", "v", "v", "uw"}, 4},
      {" \r\033[A2\r", {"uw2"}, 2, "(/zubtool)>>\n"},                    // the line before
      {"\022~\007\033[D\0222x\010\022\033[D\r", {rows}},                 // a search
      {kTel + "a\rlogdump tel b\r", {"a", "b"}, 2},                      // a paste
      {"lo\tt\tq\r", {"q"}},                                             // sub-command, handler
      {"logdump \ttel d\r", {"d"}, 2, kPrompt + "logdump\n" + offered},  // a list
      {"logdump \t\014tel c\r", {"c"}, 3},                               // and a clear screen
  };
  std::vector<std::string> all;
  for (const auto& [keys, reasons, prompts, above] : cases) {
    printed = kPrompt;
    program->type(keys);
    read(kPrompt, prompts);
    auto expected = above;
    for (const auto& reason : reasons) expected += shownFor(kTel + reason);
    EXPECT_EQ(shown(printed), expected + kAtTheEnd);
    all.insert(all.end(), reasons.begin(), reasons.end());
  }
  expectRequests(all);
}

TEST_F(Terminal, TakesAnyBytesAndAsManyAsAreTyped) {
  std::string reason(20'000, 'x');
  program->type(kTel);
  for (int i = 0; i < 40; ++i) {  // the terminal holds 4096 bytes each way
    program->type(reason.substr(0, 500));
    read(std::string(8, 'x'));
  }
  reason += "\xFF\xC3\xA9\xC2\x85\xED\xA0\x80\x80z\xE9";
  program->type(reason.substr(20000) + "\r");
  read(kPrompt);
  expectRequests({reason});
}

TEST_F(Terminal, IsAsItWasWhileACommandRuns) {
  start("xterm-256color", "", 1'000);  // milliseconds in which to see it
  program->type(kTel + "a\r");
  while (!isAsItWas(program->terminal())) sched_yield();
  program->type(kTel + "b\r");  // which is kept for the prompt
  read(kPrompt, 2);
  EXPECT_EQ(shown(printed), shownFor(kTel + "a") + shownFor(kTel + "b") + kAtTheEnd);
  expectRequests({"a", "b"});
}

TEST_F(Terminal, IsDrawnAnewWhenItsSizeChanges) {
  const std::string reason(50, 'r');
  program->type("tel " + reason.substr(1));
  read(reason.substr(1));
  const winsize size = {.ws_row = 4, .ws_col = 30, .ws_xpixel = 0, .ws_ypixel = 0};
  ioctl(program->terminal(), TIOCSWINSZ, &size);
  read(kPrompt);
  program->type("r\001logdump \t\r");
  read(kPath);  // after the line has perhaps been drawn twice
  read(kPrompt);
  EXPECT_EQ(shown(printed, 30),
            kPrompt + kTel + reason + "\nbb\n... 5 more\n" + shownFor(kTel + reason) + kAtTheEnd);
  expectRequests({reason});
}

TEST_F(Terminal, IsAsItWasWhileTheProgramIsStopped) {
  const auto line = kTel + std::string(100, 'r') + 'z';
  start("xterm-256color", R"("$@"; echo; echo stopped; read -r line; fg >/dev/null)");
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
  EXPECT_EQ(shown(printed), kPrompt + line + "\nstopped\n" + shownFor(line + 'b') + kAtTheEnd);
}

TEST_F(Terminal, IsAsItWasHoweverTheProgramEnds) {
  for (const int signal : {0, SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGUSR1, SIGXCPU}) {
    const int terminal = dup(program->terminal());
    for (const int waking : {SIGWINCH, SIGCONT}) kill(program->pid(), waking);
    signal == 0 ? program->type("quit\r") : static_cast<void>(kill(program->pid(), signal));
    EXPECT_EQ(program->finish().status, signal == 0 ? 0 : 1000 + signal);
    EXPECT_TRUE(isAsItWas(terminal)) << signal;
    close(terminal);
    start("xterm-256color");
  }
}

TEST_F(Terminal, IsReadAsBeforeWhereItsKindIsNotKnown) {
  for (const std::string term : {"dumb", "", "no-such-terminal"}) {
    start(term);
    EXPECT_TRUE(isAsItWas(program->terminal())) << term;
    program->type("quit\n");
    EXPECT_EQ(program->finish().out, "") << term;
  }
}

}  // namespace
