#pragma once

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

#include <algorithm>
#include <map>
#include <new>
#include <string>
#include <tuple>

#include "platform/terminal.h"
#include "tests/Program.h"

/// Whether the settings of a terminal are those it had before the program began.
inline bool isAsItWas(int terminal) {
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
