#include "platform/host/TerminalSession.h"

#include <poll.h>
#include <sys/ioctl.h>
#include <termios.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <tuple>

#include "platform/posix/Descriptor.h"

namespace host {
namespace {

constexpr std::string_view kMarkPastes = "\033[?2004h";
constexpr std::string_view kMarkNoPastes = "\033[?2004l";

// A signal handler has no other way to what it needs.
termios gBefore{};                          // settings to go back to
volatile std::sig_atomic_t gIsEditing = 0;  // the settings are others now
volatile std::sig_atomic_t gWasResized = 0;
volatile std::sig_atomic_t gWasContinued = 0;

/// Puts the settings back, unless another job has the terminal and settings of its own. Never
/// waits, and is safe in a handler of signals.
void leave() {
  if (gIsEditing == 0) return;
  gIsEditing = 0;
  if (!hasTerminal(STDIN_FILENO)) return;
  tcsetattr(STDIN_FILENO, TCSANOW, &gBefore);
  if (!takesOutput(STDOUT_FILENO)) return;
  std::ignore = ::write(STDOUT_FILENO, kMarkNoPastes.data(), kMarkNoPastes.size());
}

extern "C" void onWaking(int signal) { (signal == SIGCONT ? gWasContinued : gWasResized) = 1; }

/// Has a signal do what it does by default.
extern "C" void onEnding(int signal) {
  const int errorBefore = errno;
  leave();
  std::signal(signal, SIG_DFL);
  takeEffect(signal);
  std::signal(signal, onEnding);
  gWasContinued = 1;
  errno = errorBefore;
}

/// The settings for editing, but for what the user has chosen: keys come one at a time and as they
/// are, and Ctrl-C is one of them. Ctrl-Z and Ctrl-\ are signals still.
termios forEditing(termios settings) {
  settings.c_iflag &= ~static_cast<tcflag_t>(ICRNL | INLCR | IGNCR | ISTRIP);
  settings.c_lflag &= ~static_cast<tcflag_t>(ICANON | ECHO | IEXTEN);
  settings.c_cc[VINTR] = _POSIX_VDISABLE;
  settings.c_cc[VMIN] = 1;
  settings.c_cc[VTIME] = 0;
  return settings;
}

}  // namespace

std::vector<int> endingSignals() {
  constexpr std::array kOthers = {SIGKILL, SIGSTOP, SIGSEGV, SIGBUS, SIGFPE,  SIGILL,
                                  SIGTRAP, SIGSYS,  SIGCHLD, SIGURG, SIGCONT, SIGWINCH};
  std::vector<int> ending;
  for (int signal = 1; signal <= SIGRTMAX; ++signal) {
    struct sigaction now = {};
    const bool isOther = std::ranges::find(kOthers, signal) != kOthers.end();
    if (isOther || sigaction(signal, nullptr, &now) != 0) continue;
    if (now.sa_handler == SIG_DFL) ending.push_back(signal);
  }
  return ending;
}

void takeEffect(int signal) {
  sigset_t others;
  sigfillset(&others);
  sigdelset(&others, signal);
  raise(signal);
  const posix::SignalMask now(others);  // here the process ends, or stops and goes on
}

bool hasTerminal(int descriptor) {
  const pid_t owner = tcgetpgrp(descriptor);
  return owner < 0 || owner == getpgrp();
}

bool takesOutput(int descriptor) {
  pollfd output = {descriptor, POLLOUT, 0};
  return ::poll(&output, 1, 0) > 0;
}

bool canMoveCursor(int descriptor) {
  const char* const kind = std::getenv("TERM");
  return kind != nullptr && *kind != '\0' && std::string_view(kind) != "dumb" &&
         isatty(descriptor) != 0;
}

TerminalSize sizeOfTerminal() {
  winsize size{};
  ioctl(STDOUT_FILENO, TIOCGWINSZ, &size);
  if (size.ws_row == 0 || size.ws_col == 0) return {24, 80};
  return {size.ws_row, size.ws_col};
}

TerminalSession::TerminalSession() {
  for (const int signal : ending) std::signal(signal, onEnding);
  for (const int signal : {SIGCONT, SIGWINCH}) std::signal(signal, onWaking);
  enter();
}

TerminalSession::~TerminalSession() {
  leave();
  for (const int signal : ending) std::signal(signal, SIG_DFL);
  for (const int signal : {SIGCONT, SIGWINCH}) std::signal(signal, SIG_DFL);
}

/// Takes the terminal. In the background that stops the process until it is in the foreground.
void TerminalSession::enter() {
  {
    const posix::SignalMask now(blocked.before());
    while (tcdrain(STDIN_FILENO) != 0 && errno == EINTR) {
    }
  }
  gWasContinued = 0;
  termios settings{};
  tcgetattr(STDIN_FILENO, &settings);
  if (gIsEditing == 0 || (settings.c_lflag & ICANON) != 0) gBefore = settings;
  gIsEditing = 1;
  settings = forEditing(gBefore);
  tcsetattr(STDIN_FILENO, TCSANOW, &settings);
  ioctl(STDIN_FILENO, FIONREAD, &typedAhead);
  write(kMarkPastes);
}

TerminalSession::Event TerminalSession::wait(int milliseconds) {
  pollfd input = {STDIN_FILENO, POLLIN, 0};
  const timespec limit = {milliseconds / 1000, milliseconds % 1000 * 1'000'000L};
  for (int ready = -1;;) {
    if (gWasContinued != 0) {
      enter();
      return Event::continued;
    }
    if (gWasResized != 0) {
      gWasResized = 0;
      return Event::resized;
    }
    if (ready >= 0) return ready > 0 ? Event::input : Event::timeout;
    ready = ppoll(&input, 1, milliseconds < 0 ? nullptr : &limit, &blocked.before());
  }
}

bool TerminalSession::read(std::string& bytes) {
  constexpr char kCtrlD = 4;
  const posix::SignalMask now(blocked.before());
  char byte = 0;
  if (posix::readSome(STDIN_FILENO, &byte, 1) != 1) return false;
  const bool isAhead = typedAhead > 0;
  if (isAhead) --typedAhead;
  bytes += isAhead && byte == '\0' ? kCtrlD : byte;
  return true;
}

void TerminalSession::write(std::string_view text) {
  const posix::SignalMask now(blocked.before());
  std::ignore = posix::writeAll(STDOUT_FILENO, text);
}

}  // namespace host
