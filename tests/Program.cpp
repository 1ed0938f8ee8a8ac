#include "tests/Program.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <pty.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <fstream>
#include <iterator>

ScratchFolder::ScratchFolder() {
  std::string name = std::filesystem::temp_directory_path() / "zubtool-test-XXXXXX";
  if (!mkdtemp(name.data())) throw std::system_error(errno, std::generic_category(), name);
  folder = name;
}

ScratchFolder::~ScratchFolder() { std::filesystem::remove_all(folder); }

std::string readFile(const std::string& path) {
  std::ifstream stream(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(stream), {}};
}

void writeFile(const std::string& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}

void expectOutcome(const Outcome& actual, const Outcome& expected) {
  EXPECT_EQ(actual.out, expected.out);
  EXPECT_EQ(actual.err, expected.err);
  EXPECT_EQ(actual.requests, expected.requests);
  EXPECT_EQ(actual.status, expected.status);
}

Program::Program(const Start& start) {
  writeFile(scratch->path("device"), start.profile + "\nrequest-log = requests\n");
  const termios settings = terminalBefore();
  const winsize size = {.ws_row = 24, .ws_col = 80, .ws_xpixel = 0, .ws_ypixel = 0};
  int ends[2];
  if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) != 0) throw std::bad_alloc();
  fcntl(ends[1], F_SETFL, O_NONBLOCK);  // as another program that shares it may have left it
  process = start.onTerminal ? forkpty(&streams, nullptr, &settings, &size) : fork();
  if (process < 0) throw std::system_error(errno, std::generic_category(), "fork");
  if (process == 0) execute(start, ends[1]);
  close(ends[1]);
  if (start.onTerminal) close(ends[0]);
  if (!start.onTerminal) streams = ends[0];
  if (!start.input.empty()) type(start.input);  // the program may have ended by now
}

void Program::execute(const Start& start, int end) const {
  prctl(PR_SET_PDEATHSIG, SIGKILL);  // a test that is given up takes its program along
  if (!start.onTerminal) {
    dup2(end, STDIN_FILENO);
    dup2(end, STDOUT_FILENO);
    dup2(open(scratch->path("err").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600), STDERR_FILENO);
  }
  setenv("TZ", "UTC", 1);
  setenv("TERM", start.term.c_str(), 1);
  setenv("ZUB_DEVICE", "device", 1);
  std::filesystem::current_path(scratch->path(""));
  std::vector<std::string> command = {ZUBTOOL_EMULATOR};
  const bool isEmulated = !command.front().empty();
  if (isEmulated) {
    command.insert(command.end(), {"-0", start.name, ZUBTOOL_PROGRAM});  // options of qemu-user
  } else {
    command.front() = start.name;
  }
  if (!start.shell.empty()) command = {"sh", "-mc", start.shell, "sh", ZUBTOOL_PROGRAM};
  command.insert(command.end(), start.words.begin(), start.words.end());
  std::vector<char*> arguments;
  for (auto& word : command) arguments.push_back(word.data());
  arguments.push_back(nullptr);
  const bool isNamed = !isEmulated && start.shell.empty();
  execvp(isNamed ? ZUBTOOL_PROGRAM : arguments.front(), arguments.data());
  _exit(127);
}

termios Program::terminalBefore() {
  termios plain{};
  const int terminal = posix_openpt(O_NOCTTY | O_CLOEXEC);
  tcgetattr(terminal, &plain);
  close(terminal);
  cfmakeraw(&plain);  // no echo, no translation of line ends: the output is the program's own
  plain.c_lflag |= ICANON | ISIG;
  return plain;
}

void Program::type(const std::string& text) const {
  if (write(streams, text.data(), text.size()) < 0) perror("standard input of the program");
}

std::string Program::readUntil(const std::string& end) const {
  std::string text;
  for (char byte = 0; (end.empty() || !text.ends_with(end)) && read(streams, &byte, 1) == 1;) {
    text += byte;
  }
  return text;
}

Outcome Program::finish() {
  shutdown(streams, SHUT_WR);  // a terminal takes no notice
  Outcome outcome{.out = readUntil("")};
  close(streams);
  int status = 0;
  waitpid(process, &status, 0);
  outcome.status = WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
  outcome.err = readFile(scratch->path("err"));
  outcome.requests = readFile(scratch->path("requests"));
  return outcome;
}
