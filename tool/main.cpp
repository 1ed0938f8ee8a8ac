#include <pthread.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <new>

#include "platform/system.h"
#include "platform/terminal.h"
#include "tool/StartUpChecks.h"
#include "tool/ZUBShell.h"

namespace {

constexpr int kCannotStart = -1;  // status 255

/// Ends a start for which there is too little memory: there may be none for an exception either.
[[noreturn]] void RefuseToStart() {
  std::cerr << "Cannot start: not enough memory" << std::endl;
  std::exit(kCannotStart);
}

/// What the shell thread is given by the main thread, and outlives it.
struct Start {
  std::list<std::string> words;
  sigset_t signals{};  ///< blocked when the process was started
};

/// The shell thread. `given` is its `Start`.
extern "C" void* runShellThread(void* given) {
  const auto& start = *static_cast<const Start*>(given);
  pthread_sigmask(SIG_SETMASK, &start.signals, nullptr);
  try {
    const auto commandLine = start.words;
    const std::shared_ptr<CommandShell> shell(new ZUBShell(platform::readEditedLine));
    const bool succeeded = shell->run(commandLine);
    std::exit(succeeded ? EXIT_SUCCESS : EXIT_FAILURE);  // with the shell and its tree alive
  } catch (const std::bad_alloc&) {
    std::cerr << "Not enough memory" << std::endl;
  }
  std::exit(EXIT_FAILURE);
}

}  // namespace

int main(int argc, char** argv) {
  std::set_new_handler(RefuseToStart);
  platform::openStandardStreams();
  Start start{CommandShell::convertCmdArgsToList(argc, argv)};
  if (const char* const why = WhyNotToStart()) {
    std::cout << why << std::endl;
    return kCannotStart;
  }
  std::set_new_handler(nullptr);  // from here on it is an exception
  // Signals are the shell thread's. Blocked before it starts, none is taken here meanwhile.
  sigset_t all;
  sigfillset(&all);
  pthread_sigmask(SIG_BLOCK, &all, &start.signals);
  pthread_t shellThread{};
  if (const int failed = pthread_create(&shellThread, nullptr, runShellThread, &start)) {
    std::cerr << "Cannot start the shell thread: " << strerror(failed) << std::endl;
    return kCannotStart;
  }
  platform::runMainEventLoop();
  return EXIT_SUCCESS;
}
