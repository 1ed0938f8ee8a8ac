#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <type_traits>
#include <utility>

namespace dispatch {

/// Counts work that is under way, so that one thread can wait until all of it has ended.
///
/// A copy is another reference to the same group; the group lives as long as any reference. A
/// default-made group is empty: to enter it, leave it or wait on it does nothing.
///
/// Threads: every member may be called from any thread. Each enter must be matched by exactly one
/// leave; a leave without an enter ends the process. Prefer `membership`, which pairs them.
class group {
 public:
  group() = default;

  /// A new group that nobody has entered, or an empty one when the system has no memory for it.
  static group create() noexcept;

  explicit operator bool() const noexcept { return state != nullptr; }

  void enter() const;
  void leave() const;

  /// Blocks until every enter has been matched by a leave. Returns at once when there is none.
  void wait() const;

  /// The same, for at most `timeout`. True when the group was left in time.
  [[nodiscard]] bool wait(std::chrono::nanoseconds timeout) const;

 private:
  struct State;
  std::shared_ptr<State> state;
};

/// One enter of a group and the leave that belongs to it.
///
/// Enters when made or copied, leaves when destroyed; a move hands the membership over. Capture it
/// by value in whatever does the work, and the group is left when the last copy of that has gone.
class membership {
 public:
  explicit membership(group entered) : joined(std::move(entered)) { joined.enter(); }
  membership(const membership& other) : membership(other.joined) {}
  membership(membership&& other) noexcept : joined(std::exchange(other.joined, group())) {}
  membership& operator=(membership other) noexcept {
    std::swap(joined, other.joined);
    return *this;
  }
  ~membership() { joined.leave(); }

 private:
  group joined;
};

/// Can be called with `Arguments`, for a `Result`.
template <class Callable, class Result, class... Arguments>
concept callable_as = std::is_invocable_r_v<Result, Callable&, Arguments...>;

/// A reference-counted callable, which may hold none: one made of a null pointer or of an empty
/// `std::function` is empty.
///
/// A copy is another reference to the same callable, never a copy of what the callable has
/// captured; the captures are destroyed with the last reference. Calling an empty block is an
/// error of the caller's. Threads: references may be copied and dropped on any thread; what a call
/// needs is the callable's own affair.
template <class Signature>
class block;

template <class Result, class... Arguments>
class block<Result(Arguments...)> {
 public:
  block() = default;
  block(std::nullptr_t) {}

  template <callable_as<Result, Arguments...> Callable>
  block(Callable callable) {
    std::function<Result(Arguments...)> function(std::move(callable));
    if (function) body = std::make_shared<decltype(function)>(std::move(function));
  }

  explicit operator bool() const noexcept { return body != nullptr; }

  Result operator()(Arguments... arguments) const {
    return (*body)(std::forward<Arguments>(arguments)...);
  }

 private:
  std::shared_ptr<std::function<Result(Arguments...)>> body;
};

/// Runs tasks one at a time, in the order in which they were given, on a thread of its own.
///
/// A copy is another reference to the same queue; a default-made queue holds none, and drops what
/// it is given. Threads: every member may be called from any thread, tasks included; two tasks
/// never overlap. Lifetime: tasks already given still run after the last reference is gone; each
/// is released before the next one starts. At process exit, tasks that have not run are dropped.
/// Signals: the thread takes none that are sent to the process.
/// Errors: a task must not throw; one that does ends the process. A queue whose thread cannot be
/// started throws `std::system_error` when it is made.
class queue {
 public:
  queue() = default;

  /// A new queue. `label` names its thread in debuggers, as far as the system has room for it.
  explicit queue(std::string label);

  explicit operator bool() const noexcept { return worker != nullptr; }

  /// Appends `task`, which must not be empty, and does not wait for it.
  void async(block<void()> task) const;

  /// True when both refer to the same queue.
  friend bool operator==(const queue&, const queue&) = default;

 private:
  struct Worker;
  std::shared_ptr<Worker> worker;
};

}  // namespace dispatch
