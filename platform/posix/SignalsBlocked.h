#pragma once

#include <csignal>

namespace posix {

/// Blocks the signals that others send to the process on the calling thread for as long as this
/// lives. A thread that is started meanwhile never takes them. Those that report a fault of the
/// thread itself stay as they were.
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
