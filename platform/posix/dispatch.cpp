#include "platform/dispatch.h"

#include <pthread.h>

#include <algorithm>
#include <condition_variable>
#include <cstdlib>
#include <deque>
#include <mutex>
#include <new>

#include "platform/posix/Thread.h"

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
  // Notifies under the lock: the waiter may destroy the last other reference as soon as it runs.
  const std::lock_guard lock(state->mutex);
  if (state->entered == 0) std::abort();
  if (--state->entered == 0) state->left.notify_all();
}

void group::wait() const { static_cast<void>(wait(std::chrono::nanoseconds::max())); }

bool group::wait(std::chrono::nanoseconds timeout) const {
  if (!state) return true;
  constexpr std::chrono::nanoseconds kLongest = std::chrono::years(100);  // the clock adds to it
  std::unique_lock lock(state->mutex);
  return state->left.wait_for(lock, std::min(timeout, kLongest),
                              [this] { return state->entered == 0; });
}

/// The tasks of one queue, shared by its references and its thread.
struct queue::Worker {
  std::mutex mutex;
  std::condition_variable changed;
  std::deque<block<void()>> waiting;
  bool abandoned = false;  ///< no reference is left

  /// Runs tasks until the queue is abandoned and empty.
  void run() {
    std::unique_lock lock(mutex);
    for (;;) {
      changed.wait(lock, [this] { return abandoned || !waiting.empty(); });
      if (waiting.empty()) return;
      block<void()> task = std::move(waiting.front());
      waiting.pop_front();
      lock.unlock();
      task();
      task = nullptr;
      lock.lock();
    }
  }
};

queue::queue(std::string label) {
  const auto shared = std::make_shared<Worker>();
  std::thread thread = posix::startThread([shared] { shared->run(); });
  constexpr std::size_t kLongestThreadName = 15;  // pthread_setname_np(3)
  label.resize(std::min(label.size(), kLongestThreadName));
  pthread_setname_np(thread.native_handle(), label.c_str());
  thread.detach();
  // Counts the references to the queue apart from that of the thread.
  worker = std::shared_ptr<Worker>(shared.get(), [shared](Worker* left) {
    const std::lock_guard lock(left->mutex);
    left->abandoned = true;
    left->changed.notify_one();
  });
}

void queue::async(block<void()> task) const {
  if (!worker) return;
  const std::lock_guard lock(worker->mutex);
  worker->waiting.push_back(std::move(task));
  worker->changed.notify_one();
}

}  // namespace dispatch
