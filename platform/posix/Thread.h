#pragma once

#include <system_error>
#include <thread>
#include <utility>

#include "platform/posix/SignalMask.h"

namespace posix {

/// Starts a thread that blocks all signals but those of its own faults. Throws
/// `std::system_error`, whose text says that there is no thread, and why; `std::bad_alloc`.
template <class Run>
std::thread startThread(Run run) try {
  const SignalMask onTheThread;
  return std::thread(std::move(run));
} catch (const std::system_error& failure) {
  throw std::system_error(failure.code(), "no thread");
}

}  // namespace posix
