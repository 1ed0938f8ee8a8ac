#pragma once

#include <csignal>

namespace posix {

/// Blocks signals on the calling thread while this lives, and for good on the threads that it
/// starts meanwhile. Signals that report a fault of the thread itself are not blocked.
class SignalsBlocked {
 public:
  SignalsBlocked() {
    sigset_t sent;
    sigfillset(&sent);
    for (const int fault : {SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTRAP, SIGSYS}) {
      sigdelset(&sent, fault);
    }
    pthread_sigmask(SIG_BLOCK, &sent, &maskBefore);
  }
  SignalsBlocked(const SignalsBlocked&) = delete;
  SignalsBlocked& operator=(const SignalsBlocked&) = delete;
  ~SignalsBlocked() { pthread_sigmask(SIG_SETMASK, &maskBefore, nullptr); }

  /// The mask that the thread had, and has again after this.
  const sigset_t& before() const { return maskBefore; }

 private:
  sigset_t maskBefore{};
};

}  // namespace posix
