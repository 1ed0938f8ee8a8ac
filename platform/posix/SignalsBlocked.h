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
    pthread_sigmask(SIG_BLOCK, &sent, &before);
  }
  SignalsBlocked(const SignalsBlocked&) = delete;
  SignalsBlocked& operator=(const SignalsBlocked&) = delete;
  ~SignalsBlocked() { pthread_sigmask(SIG_SETMASK, &before, nullptr); }

 private:
  sigset_t before{};
};

}  // namespace posix
