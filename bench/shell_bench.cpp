// The shell, the hand-over through a task group, and the start of the program.

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <condition_variable>
#include <iostream>
#include <mutex>
#include <thread>

#include "bench/Ratio.h"
#include "framework/CommandShell.h"

namespace {

constexpr int kLines = 200'000;

class EmptyCommand : public CommandBase {
 public:
  static std::shared_ptr<CommandBase> create() {
    std::shared_ptr<CommandBase> node(new EmptyCommand("zubtool", {}));
    node->init();
    return node;
  }

 private:
  using CommandBase::CommandBase;
  void registerCommands() override {}
};

class EmptyShell : public CommandShell {
  std::shared_ptr<CommandBase> createRootCommand() override { return EmptyCommand::create(); }
};

/// Runs `program` with `text` piped to its standard input and its standard output piped away.
template <class Program>
void runOverPipes(const std::string& text, Program&& program) {
  int in[2];
  int out[2];
  if (pipe2(in, O_CLOEXEC) != 0 || pipe2(out, O_CLOEXEC) != 0) std::abort();
  const int terminal = dup(STDOUT_FILENO);
  dup2(in[0], STDIN_FILENO);
  dup2(out[1], STDOUT_FILENO);
  close(in[0]);
  close(out[1]);
  std::thread writer([&] {
    for (std::size_t done = 0; done < text.size();) {
      const auto written = write(in[1], text.data() + done, text.size() - done);
      if (written < 0) std::abort();
      done += static_cast<std::size_t>(written);
    }
    close(in[1]);
  });
  std::thread reader([&] {
    char piece[65536];
    while (read(out[0], piece, sizeof piece) > 0) {
    }
  });
  std::cin.clear();
  static_cast<void>(program());
  std::cout.flush();
  dup2(terminal, STDOUT_FILENO);
  close(terminal);
  writer.join();
  reader.join();
  close(out[0]);
}

void bareLoop() {
  for (std::string line;;) {
    std::cout << "(/zubtool)>> " << std::flush;
    if (!std::getline(std::cin, line)) return;
  }
}

void BM_ShellLines(benchmark::State& state) {
  std::string text;
  for (int i = 0; i < kLines; ++i) text += "back\n";
  bench::compare(
      state, [&] { runOverPipes(text, [] { return EmptyShell().run({"zubtool"}); }); },
      [&] { runOverPipes(text, bareLoop); });
}
BENCHMARK(BM_ShellLines)->UseManualTime()->Iterations(7)->Unit(benchmark::kMillisecond);

/// Hands work to another thread through `post`, which calls what it is given there.
class OtherThread {
 public:
  OtherThread() : thread([this] { work(); }) {}
  ~OtherThread() {
    post({});
    thread.join();
  }
  void post(std::function<void()> task) {
    const std::lock_guard lock(mutex);
    next = std::move(task);
    posted = true;
    changed.notify_one();
  }

 private:
  void work() {
    for (;;) {
      std::unique_lock lock(mutex);
      changed.wait(lock, [this] { return posted; });
      posted = false;
      const auto task = std::move(next);
      lock.unlock();
      if (!task) return;
      task();
    }
  }
  std::mutex mutex;
  std::condition_variable changed;
  std::function<void()> next;
  bool posted = false;
  std::thread thread;
};

void BM_GroupHandOver(benchmark::State& state) {
  constexpr int kRounds = 20'000;
  OtherThread other;
  bench::compare(
      state,
      [&] {
        for (int i = 0; i < kRounds; ++i) {
          const auto group = dispatch::group::create();
          group.enter();
          other.post([group] { group.leave(); });
          group.wait();
        }
      },
      [&] {
        for (int i = 0; i < kRounds; ++i) {
          std::mutex mutex;
          std::condition_variable left;
          bool done = false;
          other.post([&] {
            const std::lock_guard lock(mutex);
            done = true;
            left.notify_one();
          });
          std::unique_lock lock(mutex);
          left.wait(lock, [&] { return done; });
        }
      });
}
BENCHMARK(BM_GroupHandOver)->UseManualTime()->Iterations(11)->Unit(benchmark::kMillisecond);

/// A command line that does nothing; what it costs beyond the wait for the server's first word.
void BM_StartUp(benchmark::State& state) {
  constexpr double kServerWait = 0.5;
  std::vector<double> beyond;
  for ([[maybe_unused]] auto _ : state) {
    const double seconds = bench::secondsOf([] {
      char name[] = "zubtool";
      char nothing[] = "--";
      char* const arguments[] = {name, nothing, nullptr};
      pid_t child = -1;
      if (posix_spawn(&child, ZUBTOOL_PROGRAM, nullptr, nullptr, arguments, environ) != 0) {
        std::abort();
      }
      int status = 0;
      waitpid(child, &status, 0);
      if (status != 0) std::abort();
    });
    beyond.push_back((seconds - kServerWait) * 1000);
    state.SetIterationTime(seconds);
  }
  state.counters["beyond_ms"] = bench::median(beyond);
}
BENCHMARK(BM_StartUp)->UseManualTime()->Iterations(11)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  std::ios::sync_with_stdio(false);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
}
