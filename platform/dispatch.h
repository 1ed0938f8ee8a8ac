#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <type_traits>
#include <utility>

namespace dispatch {

/// Counts work in progress, so that a thread can wait for all of it.
///
/// A copy refers to the same group, which lives as long as any reference. A default-constructed
/// group is empty: entering it, leaving it and waiting for it do nothing.
///
/// Each enter must be matched by exactly one leave; a leave without an enter ends the process.
/// Prefer `membership`, which pairs them. Threads: any.
class group {
 public:
  group() = default;

  /// Returns a new group, or an empty one when there is no memory for it.
  static group create() noexcept;

  explicit operator bool() const noexcept { return state != nullptr; }

  void enter() const;
  void leave() const;

  /// Blocks until every enter has been matched by a leave.
  void wait() const;

  /// The same, for at most `timeout`. Returns false on a time-out.
  [[nodiscard]] bool wait(std::chrono::nanoseconds timeout) const;

 private:
  struct State;
  std::shared_ptr<State> state;
};

/// An enter of a group and its leave.
///
/// Enters when constructed or copied, and leaves when destroyed; a move transfers the membership.
/// Capture it by value in the callable that does the work: the group is left when the last copy of
/// that callable is destroyed.
class membership {
 public:
  explicit membership(group entered) : joined(std::move(entered)) { joined.enter(); }
  membership(const membership& other) : membership(other.joined) {}
  membership(membership&& other) noexcept : joined(std::exchange(other.joined, group())) {}
  ~membership() { joined.leave(); }

 private:
  group joined;
};

template <class Callable, class Result, class... Arguments>
concept callable_as = std::is_invocable_r_v<Result, Callable&, Arguments...>;

/// A reference-counted callable.
///
/// A copy refers to the same callable and copies none of its captures, which are destroyed with the
/// last reference. A block constructed from a null pointer or an empty `std::function` is empty,
/// and must not be called. Threads: references may be copied and destroyed on any thread; calls are
/// not synchronized.
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
/// A copy refers to the same queue. A default-constructed queue is empty and discards its tasks.
///
/// Threads: any, also that of a task. Lifetime: the tasks given still run after the last reference
/// is gone, but not after exit(3); each is destroyed before the next one starts. Signals: the
/// thread takes none that are sent to the process. Errors: a task that throws ends the process.
class queue {
 public:
  queue() = default;

  /// `label` names the thread in debuggers; the system may cut it. Throws `std::system_error` when
  /// no thread can be started, and `std::bad_alloc`.
  explicit queue(std::string label);

  /// Appends `task`, which must not be empty, and returns at once. On `std::bad_alloc` the task
  /// does not run.
  void async(block<void()> task) const;

 private:
  struct Worker;
  std::shared_ptr<Worker> worker;
};

}  // namespace dispatch
