// A person at a terminal: the keys, what is run, what is shown, and the terminal's settings.

#include <gtest/gtest.h>
#include <termios.h>

#include <csignal>

#include "tests/Program.h"

namespace {

const std::string kPrompt = "(/zubtool)>> ";
const std::string kTel = "logdump tel ";

std::string requestOf(const std::string& reason) {
  return "GetTraceProperty {TraceName=\"TraceSystemLogs\", TracePropertyName=\"TraceMode\"}\n"
         "TraceDumpState {TraceAction=\"CollectTelephonyLogs\", TraceDumpStateReason=\"[zubtool] " +
         reason + "\", TraceDumpStatePerformCompression=1}\n";
}

Program start(const std::string& term) {
  Program program({.profile = "dump-timestamp = T", .onTerminal = true, .term = term});
  EXPECT_TRUE(program.readUntil(kPrompt).ends_with(kPrompt));
  return program;
}

/// Whether the terminal waits for whole lines, as it did before the program began.
bool takesLines(const Program& program) {
  termios now{};
  tcgetattr(program.terminal(), &now);
  return (now.c_lflag & ICANON) != 0;
}

/// Types, and waits until each of the `lines` in it has run.
void typeLines(const Program& program, const std::string& keys, int lines) {
  constexpr std::size_t kChunk = 512;  // the terminal holds 4096 bytes each way
  for (std::size_t i = 0; i < keys.size(); i += kChunk) {
    const auto chunk = keys.substr(i, kChunk);
    program.type(chunk);
    if (chunk.size() == kChunk) program.readUntil(chunk.substr(kChunk - 8));
  }
  for (int i = 0; i < lines; ++i) program.readUntil(">> ");
}

TEST(Terminal, EditsLinesAndRunsWhatTheyBecome) {
  if (takesLines(start("xterm-256color"))) GTEST_SKIP() << "no line editing in this build";
  const std::string bytes = "\xFF\xC3\xA9\xC2\x85\xED\xA0\x80\x80z\xE9";
  const struct {
    std::string keys;
    int lines;
    std::string requests;
  } cases[] = {
      {kTel + "ac\033[Db\r", 1, requestOf("abc")},                   // left
      {"tel x\033[Hlogdump \r", 1, requestOf("x")},                  // to the start
      {"lo\tt\tq\r", 1, requestOf("q")},                             // sub-command and handler
      {"logdump \ttel d\r", 2, requestOf("d")},                      // a list, and the prompt again
      {kTel + "ef\033[D\004\r", 1, requestOf("e")},                  // a character taken away
      {kTel + "nonui\027w\r", 1, requestOf("w")},                    // a word taken back
      {kTel + "1\r\033[A2\r", 2, requestOf("1") + requestOf("12")},  // the line before
      {kTel + "1\rhelp\r\022tel\033[F2\r", 3, requestOf("1") + requestOf("12")},  // a search
      {kTel + bytes + "\r", 1, requestOf(bytes)},
      {kTel + "a\rlogdump tel b\r", 2, requestOf("a") + requestOf("b")},  // a paste
      {kTel + std::string(20000, 'x') + "\r", 1, requestOf(std::string(20000, 'x'))},
  };
  for (const auto& one : cases) {
    auto program = start("xterm-256color");
    typeLines(program, one.keys, one.lines);
    program.type("\004");
    const auto outcome = program.finish();
    EXPECT_EQ(outcome.out, "") << "the end of the input shows nothing";
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.requests, one.requests) << one.keys;
  }
}

TEST(Terminal, IsAsItWasHoweverTheProgramEnds) {
  for (const int signal : {0, SIGINT, SIGTERM, SIGHUP, SIGQUIT}) {
    auto program = start("xterm-256color");
    if (takesLines(program)) GTEST_SKIP() << "no line editing in this build";
    const int terminal = dup(program.terminal());
    for (const int waking : {SIGWINCH, SIGCONT}) kill(program.pid(), waking);
    signal == 0 ? program.type("quit\r") : static_cast<void>(kill(program.pid(), signal));
    EXPECT_EQ(program.finish().status, signal == 0 ? 0 : 1000 + signal);
    termios after{};
    tcgetattr(terminal, &after);
    EXPECT_NE(after.c_lflag & ICANON, 0U) << signal;
    close(terminal);
  }
}

TEST(Terminal, IsReadAsBeforeWhereItsKindIsNotKnown) {
  for (const std::string term : {"dumb", "", "no-such-terminal"}) {
    auto program = start(term);
    EXPECT_TRUE(takesLines(program)) << term;
    typeLines(program, "quit\n", 0);
    EXPECT_EQ(program.finish().out, "") << term;
  }
}

}  // namespace
