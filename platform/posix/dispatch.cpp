#include "platform/dispatch.h"

#include <pthread.h>

#include <algorithm>
#include <condition_variable>
#include <cstdlib>
#include <deque>
#include <mutex>
#include <new>
#include <thread>

#include "platform/posix/SignalsBlocked.h"

namespace dispatch {

struct group::State {
  std::mutex mutex;
  std::condition_variable left;
  std::size_t entered = 0;
};

group group::create() noexcept {
  group made;
  try {
    made.state = std::make_shared<State>();
  } catch (const std::bad_alloc&) {  // the empty group says so
    made.state = nullptr;
  }
  return made;
}

void group::enter() const {
  if (!state) return;
  const std::lock_guard lock(state->mutex);
  ++state->entered;
}

void group::leave() const {
  if (!state) return;
  // Notified under the lock: the waiter may drop the last other reference as soon as it runs.
  const std::lock_guard lock(state->mutex);
  if (state->entered == 0) std::abort();
  if (--state->entered == 0) state->left.notify_all();
}

void group::wait() const {
  if (!state) return;
  std::unique_lock lock(state->mutex);
  state->left.wait(lock, [this] { return state->entered == 0; });
}

bool group::wait(std::chrono::nanoseconds timeout) const {
  if (!state) return true;
  constexpr std::chrono::nanoseconds kLongest = std::chrono::years(100);  // to which a clock adds
  std::unique_lock lock(state->mutex);
  return state->left.wait_for(lock, std::min(timeout, kLongest),
                              [this] { return state->entered == 0; });
}

namespace {

/// The tasks of one queue; shared by its references and its thread.
struct Tasks {
  std::mutex mutex;
  std::condition_variable changed;
  std::deque<block<void()>> waiting;
  bool abandoned = false;  ///< the last reference has gone
};

/// Runs tasks until the queue is abandoned and empty. Each task is released before the next wait.
void runTasks(Tasks& tasks) {
  std::unique_lock lock(tasks.mutex);
  for (;;) {
    tasks.changed.wait(lock, [&] { return tasks.abandoned || !tasks.waiting.empty(); });
    if (tasks.waiting.empty()) return;
    block<void()> task = std::move(tasks.waiting.front());
    tasks.waiting.pop_front();
    lock.unlock();
    task();
    task = nullptr;
    lock.lock();
  }
}

}  // namespace

/// Shared by the references alone: when it goes, the thread knows that no further task can come.
struct queue::Worker {
  std::shared_ptr<Tasks> tasks = std::make_shared<Tasks>();

  explicit Worker(const std::string& label) {
    const posix::SignalsBlocked onTheThread;
    std::thread thread([owned = tasks] { runTasks(*owned); });
    constexpr std::size_t kLongestThreadName = 15;  // pthread_setname_np(3)
    pthread_setname_np(thread.native_handle(), label.substr(0, kLongestThreadName).c_str());
    thread.detach();
  }
  Worker(const Worker&) = delete;
  Worker& operator=(const Worker&) = delete;
  ~Worker() {
    const std::lock_guard lock(tasks->mutex);
    tasks->abandoned = true;
    tasks->changed.notify_one();
  }
};

queue::queue(std::string label) : worker(std::make_shared<Worker>(label)) {}

void queue::async(block<void()> task) const {
  if (!worker) return;
  const std::lock_guard lock(worker->tasks->mutex);
  worker->tasks->waiting.push_back(std::move(task));
  worker->tasks->changed.notify_one();
}

}  // namespace dispatch
