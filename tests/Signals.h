#pragma once

#include <csignal>

/// Whether the calling thread takes no signal that ends or stops the process.
inline bool signalsAreBlocked() {
  sigset_t blocked;
  pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
  for (const int signal : {SIGHUP, SIGINT, SIGTERM, SIGTSTP, SIGUSR1, SIGRTMIN}) {
    if (sigismember(&blocked, signal) == 0) return false;
  }
  return true;
}
