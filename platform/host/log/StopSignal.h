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

  /// Blocks until `descriptor` has something to read, or has ended or failed, or a signal of the
  /// system comes; false when this signal is raised, before that or with it. -1 is a descriptor of
  /// which nothing ever comes.
  bool waitReadable(int descriptor) const;

 private:
  posix::Descriptor event;
  std::atomic<bool> isRaised = false;
};

}  // namespace host
