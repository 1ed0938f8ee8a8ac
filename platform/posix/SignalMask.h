#pragma once

#include <csignal>

namespace posix {

/// Changes the calling thread's mask of blocked signals while it lives. A thread that is started
/// meanwhile keeps the changed mask.
class SignalMask {
 public:
  /// Blocks all signals but those that report a fault of the thread itself.
  SignalMask() {
    sigset_t sent;
    sigfillset(&sent);
    for (const int fault : {SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTRAP, SIGSYS}) {
      sigdelset(&sent, fault);
    }
    pthread_sigmask(SIG_BLOCK, &sent, &maskBefore);
  }

  /// Blocks `blocked`, and no others.
  explicit SignalMask(const sigset_t& blocked) {
    pthread_sigmask(SIG_SETMASK, &blocked, &maskBefore);
  }

  SignalMask(const SignalMask&) = delete;
  SignalMask& operator=(const SignalMask&) = delete;
  ~SignalMask() { pthread_sigmask(SIG_SETMASK, &maskBefore, nullptr); }

  /// The mask that the thread had, and has again after this.
  const sigset_t& before() const { return maskBefore; }

 private:
  sigset_t maskBefore{};
};

}  // namespace posix
