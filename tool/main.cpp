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

/// Ends the process when memory runs out at the start: an exception would need memory too.
[[noreturn]] void RefuseToStart() {
  std::cerr << "Cannot start: not enough memory" << std::endl;
  std::exit(kCannotStart);
}

/// What the main thread passes to the shell thread. It outlives that thread.
struct Start {
  std::list<std::string> words;  ///< of the command line
  sigset_t signals{};            ///< blocked when the process was started
};

/// The shell thread. `argument` is its `Start`.
extern "C" void* runShellThread(void* argument) {
  const auto& start = *static_cast<const Start*>(argument);
  pthread_sigmask(SIG_SETMASK, &start.signals, nullptr);
  try {
    const auto commandLine = start.words;
    const std::shared_ptr<CommandShell> shell(
        new ZUBShell(platform::readEditedLine, platform::showWork));
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
  // Only the shell thread takes signals. They are blocked before it starts; it restores the mask.
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
