#include <sys/ioctl.h>
#include <termios.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <memory>
#include <mutex>
#include <stop_token>
#include <string>
#include <thread>

#include "platform/host/TerminalSession.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/SignalMask.h"
#include "platform/terminal.h"

namespace {

using std::chrono::steady_clock;

constexpr int kWaking = SIGURG;  // has no effect but on the thread that awaits it

// Of the work under way, of which there is one at a time.
std::mutex gMutex;
bool gMayShow = false;
bool gIsShown = false;

void print(const std::string& text) { static_cast<void>(posix::writeAll(STDOUT_FILENO, text)); }

/// Whether a line has been typed, which the terminal then shows.
bool wasLineTyped() {
  int bytes = 0;
  termios settings{};
  return tcgetattr(STDIN_FILENO, &settings) == 0 && (settings.c_lflag & ECHO) != 0 &&
         ioctl(STDIN_FILENO, FIONREAD, &bytes) == 0 && bytes > 0;
}

void clear() {
  if (!gIsShown) return;
  gIsShown = false;
  if (host::hasTerminal(STDOUT_FILENO)) print(wasLineTyped() ? "\033[A\r \033[J\r" : "\r\033[K");
}

/// "1:05", or "1:05, 1200 lines" once there are lines.
std::string describe(std::chrono::seconds time, std::size_t lines) {
  const auto seconds = std::to_string(time.count() % 60);
  return std::to_string(time.count() / 60) + (seconds.size() < 2 ? ":0" : ":") + seconds +
         (lines > 0 ? ", " + std::to_string(lines) + " lines" : "");
}

/// Shows a command that runs, from a thread which takes the signals that the shell thread has
/// blocked meanwhile.
class WorkLine {
 public:
  WorkLine() {
    sigemptyset(&awaited);
    sigaddset(&awaited, kWaking);
    for (const int signal : host::endingSignals()) sigaddset(&awaited, signal);
    gMayShow = true;
    thread = std::jthread([this](const std::stop_token& over) { run(over); });
  }
  ~WorkLine() {
    posix::beforeOutput();
    thread.request_stop();
    pthread_kill(thread.native_handle(), kWaking);
  }

 private:
  void run(const std::stop_token& over) const {
    constexpr timespec kSecond = {1, 0};
    for (;;) {
      const int signal = sigtimedwait(&awaited, nullptr, &kSecond);
      if (signal == kWaking && over.stop_requested()) return;
      if (signal > 0) take(signal);
      if (signal < 0 && errno == EAGAIN) draw();
    }
  }

  void draw() const {
    const std::lock_guard lock(gMutex);
    if (!gMayShow || !host::hasTerminal(STDOUT_FILENO)) return;
    if (!host::takesOutput(STDOUT_FILENO)) return;
    if (wasLineTyped()) return clear();
    const auto time = std::chrono::floor<std::chrono::seconds>(steady_clock::now() - begin);
    auto text = "\rrunning " + describe(time, posix::linesWritten() - linesBefore);
    text.resize(std::min(text.size(), host::sizeOfTerminal().columns));
    print(text + "\033[K");
    gIsShown = true;
  }

  /// Has a signal do what it does by default, at once: it never waits for a terminal that Ctrl-S
  /// has stopped, nor for a thread that does.
  void take(int signal) const {
    const std::unique_lock lock(gMutex, std::try_to_lock);
    if (lock && host::takesOutput(STDOUT_FILENO)) clear();
    host::takeEffect(signal);
  }

  const steady_clock::time_point begin = steady_clock::now();
  const std::size_t linesBefore = posix::linesWritten();
  const posix::SignalMask here;  // and on the thread
  sigset_t awaited{};
  std::jthread thread;
};

}  // namespace

void posix::beforeOutput() {
  const std::lock_guard lock(gMutex);
  gMayShow = false;
  clear();
}

std::shared_ptr<void> platform::showWork() {
  if (!host::canMoveCursor(STDOUT_FILENO) || !host::canMoveCursor(STDERR_FILENO)) return nullptr;
  try {
    return std::make_shared<WorkLine>();
  } catch (const std::exception&) {  // no descriptor, no thread, no memory: nothing is shown
    return nullptr;
  }
}
