#include "platform/host/log/JournalProcess.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <mutex>
#include <set>
#include <string_view>
#include <system_error>
#include <thread>

namespace host {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds kTimeToStop = std::chrono::seconds(1);
constexpr std::chrono::milliseconds kBetweenLooks{1};

void check(int error, const char* what) {
  if (error != 0) throw std::system_error(error, std::generic_category(), what);
}

/// The processes that run, for the exit of this one: the thread that would stop them may never get
/// to it. Never destroyed, since threads outlive exit.
class RunningProcesses {
 public:
  static RunningProcesses& all() {
    static auto* const processes = [] {
      std::atexit([] { all().kill(); });
      return new RunningProcesses;
    }();
    return *processes;
  }

  /// Calls `spawn`, which returns an error number and, where that is 0, has set `process`.
  template <class Spawn>
  int start(const pid_t& process, Spawn spawn) {
    const std::lock_guard lock(mutex);
    const int error = spawn();
    if (error == 0) running.insert(process);
    return error;
  }

  /// waitpid(2) for one of them, which is none of them any more once it has been reaped: from then
  /// on its number may be another's.
  pid_t reap(pid_t process, int& status, int options) {
    const std::lock_guard lock(mutex);
    const pid_t ended = ::waitpid(process, &status, options);
    if (ended == process) running.erase(process);
    return ended;
  }

 private:
  void kill() {
    const std::lock_guard lock(mutex);
    for (const pid_t process : running) ::kill(process, SIGKILL);
  }

  std::mutex mutex;
  std::set<pid_t> running;
};

/// The environment, without what would change what journalctl writes on standard error, which tells
/// whether it has read everything.
std::vector<char*> plainEnvironment() {
  std::vector<char*> kept;
  for (char** entry = environ; *entry != nullptr; ++entry) {
    if (!std::string_view(*entry).starts_with("SYSTEMD_")) kept.push_back(*entry);
  }
  kept.push_back(nullptr);
  return kept;
}

struct Pipe {
  Pipe() {
    std::array<int, 2> ends{};
    check(::pipe2(ends.data(), O_CLOEXEC) == 0 ? 0 : errno, "pipe");
    reading = posix::Descriptor(ends[0]);
    writing = posix::Descriptor(ends[1]);
  }
  posix::Descriptor reading;
  posix::Descriptor writing;
};

/// What the new process is given, for the duration of its start.
class SpawnSettings {
 public:
  SpawnSettings(const posix::Descriptor& output, const posix::Descriptor& error) {
    check(::posix_spawn_file_actions_init(&actions), "posix_spawn");
    check(::posix_spawnattr_init(&attributes), "posix_spawn");
    sigset_t signals;
    sigemptyset(&signals);
    check(::posix_spawnattr_setsigmask(&attributes, &signals), "posix_spawn");
    sigfillset(&signals);
    check(::posix_spawnattr_setsigdefault(&attributes, &signals), "posix_spawn");
    check(::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF),
          "posix_spawn");
    check(::posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0),
          "posix_spawn");
    check(::posix_spawn_file_actions_adddup2(&actions, output.get(), STDOUT_FILENO), "posix_spawn");
    check(::posix_spawn_file_actions_adddup2(&actions, error.get(), STDERR_FILENO), "posix_spawn");
  }
  SpawnSettings(const SpawnSettings&) = delete;
  SpawnSettings& operator=(const SpawnSettings&) = delete;
  ~SpawnSettings() {
    ::posix_spawn_file_actions_destroy(&actions);
    ::posix_spawnattr_destroy(&attributes);
  }

  posix_spawn_file_actions_t actions{};
  posix_spawnattr_t attributes{};
};

}  // namespace

JournalProcess::JournalProcess(const std::vector<std::string>& arguments) {
  Pipe output;
  Pipe error;
  check(::fcntl(error.writing.get(), F_SETFL, O_NONBLOCK) == 0 ? 0 : errno, "pipe");
  check(::fcntl(error.reading.get(), F_SETFL, O_NONBLOCK) == 0 ? 0 : errno, "pipe");
  const SpawnSettings settings(output.writing, error.writing);

  const std::string name = "journalctl";
  std::vector<char*> words = {const_cast<char*>(name.c_str())};
  for (const std::string& word : arguments) words.push_back(const_cast<char*>(word.c_str()));
  words.push_back(nullptr);
  const auto environment = plainEnvironment();
  check(RunningProcesses::all().start(process,
                                      [&] {
                                        return ::posix_spawnp(
                                            &process, name.c_str(), &settings.actions,
                                            &settings.attributes, words.data(), environment.data());
                                      }),
        "journalctl");
  standardOutput = std::move(output.reading);
  standardError = std::move(error.reading);
}

JournalProcess::~JournalProcess() {
  if (success) return;
  ::kill(process, SIGTERM);
  if (succeeded(kTimeToStop)) return;
  ::kill(process, SIGKILL);
  int status = 0;
  while (RunningProcesses::all().reap(process, status, 0) < 0 && errno == EINTR) {
  }
}

std::string JournalProcess::messages() {
  std::string text;
  std::array<char, 4096> piece{};
  for (;;) {
    const ssize_t count = ::read(standardError.get(), piece.data(), piece.size());
    if (count <= 0) return text;
    text.append(piece.data(), static_cast<std::size_t>(count));
  }
}

std::optional<bool> JournalProcess::succeeded(std::chrono::milliseconds timeout) {
  const Clock::time_point deadline = Clock::now() + timeout;
  while (!success) {
    int status = 0;
    const pid_t ended = RunningProcesses::all().reap(process, status, WNOHANG);
    if (ended == process) {
      success = WIFEXITED(status) && WEXITSTATUS(status) == 0;
    } else if (ended < 0 && errno != EINTR) {
      success = false;  // reaped by someone else, and how it ended is not known
    } else if (Clock::now() >= deadline) {
      break;
    } else {
      std::this_thread::sleep_for(kBetweenLooks);
    }
  }
  return success;
}

}  // namespace host
