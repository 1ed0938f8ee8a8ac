#include "platform/host/TerminalSession.h"

#include <poll.h>
#include <pthread.h>
#include <termios.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <ctime>

namespace host {
namespace {

constexpr std::array kEnding = {SIGHUP,  SIGINT,  SIGQUIT, SIGTERM, SIGABRT,
                                SIGTSTP, SIGALRM, SIGUSR1, SIGUSR2, SIGXCPU};
constexpr std::array kWaking = {SIGCONT, SIGWINCH};

// Signal handlers have no other way to what they need.
termios gBefore{};                      // settings to go back to
termios gEditing{};                     // those for editing
std::atomic<pthread_t> gEditor = {};    // the thread that edits
std::atomic<bool> gIsEditing = false;   // the settings may be other than before
std::atomic<bool> gIsBusy = false;      // the editor may be about to change them
std::atomic<bool> gIsGivenUp = false;   // nobody may change them: the process ends or stops
std::atomic<bool> gWasResized = false;  // for the editor, at its next wait
std::atomic<bool> gWasContinued = false;
std::array<struct sigaction, kEnding.size()> gEndingBefore{};
std::array<struct sigaction, kWaking.size()> gWakingBefore{};

void pauseFor1ms() {
  constexpr timespec kPause = {.tv_sec = 0, .tv_nsec = 1'000'000};
  nanosleep(&kPause, nullptr);
}

void apply(int when, const termios& settings) {
  while (tcsetattr(STDIN_FILENO, when, &settings) != 0 && errno == EINTR) {
  }
}

/// Puts the settings back and keeps the editor from changing them. Safe in a signal handler.
void giveUp() {
  gIsGivenUp = true;
  // The editor may be stuck in an output that nobody reads; so there is an end to the patience.
  for (int i = 0; gIsBusy && i < 200; ++i) pauseFor1ms();
  if (gIsEditing.exchange(false)) apply(TCSANOW, gBefore);
}

void wakeEditor() {
  if (pthread_equal(gEditor, pthread_self()) == 0) pthread_kill(gEditor, SIGWINCH);
}

void setSignals(sigset_t& set, const auto& signals) {
  sigemptyset(&set);
  for (const int signal : signals) sigaddset(&set, signal);
}

extern "C" void onEndingSignal(int signal) {
  const int errorBefore = errno;
  giveUp();
  std::size_t index = 0;
  while (kEnding[index] != signal) ++index;
  struct sigaction own = {};
  sigaction(signal, &gEndingBefore[index], &own);
  sigset_t only;
  sigemptyset(&only);
  sigaddset(&only, signal);
  raise(signal);
  pthread_sigmask(SIG_UNBLOCK, &only, nullptr);  // here it ends, or stops and goes on
  sigaction(signal, &own, nullptr);
  gIsGivenUp = false;
  wakeEditor();
  errno = errorBefore;
}

extern "C" void onWakingSignal(int signal) {
  const int errorBefore = errno;
  (signal == SIGCONT ? gWasContinued : gWasResized) = true;
  wakeEditor();
  errno = errorBefore;
}

/// From here on the editor may change the settings, once nobody has given them up.
void becomeBusy() {
  gIsBusy = true;
  while (gIsGivenUp) {
    gIsBusy = false;
    pauseFor1ms();
    gIsBusy = true;
  }
}

/// Has `signals` handled; those that are ignored stay so.
template <std::size_t N>
void handle(const std::array<int, N>& signals, void (*handler)(int),
            std::array<struct sigaction, N>& before) {
  struct sigaction action = {};
  action.sa_handler = handler;
  action.sa_flags = SA_RESTART;
  for (std::size_t i = 0; i < N; ++i) {
    sigaction(signals[i], nullptr, &before[i]);
    const bool isIgnored = before[i].sa_handler == SIG_IGN;
    if (!isIgnored || signals[i] == SIGWINCH) sigaction(signals[i], &action, nullptr);
  }
}

template <std::size_t N>
void handleAsBefore(const std::array<int, N>& signals,
                    const std::array<struct sigaction, N>& before) {
  for (std::size_t i = 0; i < N; ++i) sigaction(signals[i], &before[i], nullptr);
}

/// Reads the settings once the process has the terminal; a change from the background stops it.
void readSettings(termios& settings) {
  while (tcdrain(STDIN_FILENO) != 0 && errno == EINTR) {
  }
  tcgetattr(STDIN_FILENO, &settings);
}

}  // namespace

TerminalSession::TerminalSession() {
  static const int registered = std::atexit(giveUp);
  static_cast<void>(registered);
  sigset_t handled;
  setSignals(handled, kEnding);
  for (const int signal : kWaking) sigaddset(&handled, signal);
  gEditor = pthread_self();
  pthread_sigmask(SIG_BLOCK, &handled, &signalsBefore);
  handle(kEnding, onEndingSignal, gEndingBefore);
  handle(kWaking, onWakingSignal, gWakingBefore);
  becomeBusy();
  readSettings(gBefore);
  gIsEditing = true;
}

TerminalSession::~TerminalSession() {
  if (gIsEditing) apply(TCSADRAIN, gBefore);
  gIsEditing = false;
  handleAsBefore(kWaking, gWakingBefore);
  handleAsBefore(kEnding, gEndingBefore);
  gIsBusy = false;
  pthread_sigmask(SIG_SETMASK, &signalsBefore, nullptr);
}

TerminalSession::Event TerminalSession::wait(int milliseconds) {
  if (gIsEditing) tcgetattr(STDIN_FILENO, &gEditing);
  pollfd input = {.fd = STDIN_FILENO, .events = POLLIN, .revents = 0};
  const timespec limit = {.tv_sec = milliseconds / 1000,
                          .tv_nsec = milliseconds % 1000 * 1'000'000L};
  for (;;) {
    gIsBusy = false;
    const int ready = ppoll(&input, 1, milliseconds < 0 ? nullptr : &limit, &signalsBefore);
    becomeBusy();
    const bool wasResized = gWasResized.exchange(false);
    const bool wasContinued = gWasContinued.exchange(false);
    if (wasContinued || !gIsEditing) {
      termios now{};
      readSettings(now);
      if ((now.c_lflag & ICANON) != 0) gBefore = now;
      apply(TCSADRAIN, gEditing);
      gIsEditing = true;
    }
    if (wasContinued) return Event::continued;
    if (wasResized) return Event::resized;
    if (ready > 0) return Event::input;
    if (ready == 0) return Event::timeout;
  }
}

}  // namespace host
