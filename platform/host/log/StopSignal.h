#pragma once

#include <atomic>

#include "platform/posix/Descriptor.h"

namespace host {

/// Asks a thread to stop, also one that is blocked in `waitReadable`. Once raised it stays so.
/// Threads: any.
class StopSignal {
 public:
  /// Throws `std::system_error` when the system has no descriptor for it.
  StopSignal();

  void raise() noexcept;
  bool raised() const noexcept { return isRaised.load(std::memory_order_relaxed); }

  /// Waits until `descriptor` is readable, at its end or in error, or a system signal interrupts
  /// the wait. Returns false when this signal has been raised. With -1 it waits for this signal
  /// alone.
  bool waitReadable(int descriptor) const;

 private:
  posix::Descriptor event;
  std::atomic<bool> isRaised = false;
};

}  // namespace host
