#include <pthread.h>

#include <cstdlib>
#include <cstring>
#include <iostream>
#include <new>

#include "platform/system.h"
#include "tool/StartUpChecks.h"
#include "tool/ZUBShell.h"

namespace {

constexpr int kCannotStart = -1;  // status 255

/// Ends a start for which there is too little memory: there may be none for an exception either.
[[noreturn]] void RefuseToStart() {
  std::cerr << "Cannot start: not enough memory" << std::endl;
  std::exit(kCannotStart);
}

/// The shell thread. `words` is the command line's word list, which outlives the thread.
extern "C" void* runShellThread(void* words) {
  try {
    const auto commandLine = *static_cast<const std::list<std::string>*>(words);
    const std::shared_ptr<CommandShell> shell(new ZUBShell);
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
  auto words = CommandShell::convertCmdArgsToList(argc, argv);
  if (const char* const why = WhyNotToStart()) {
    std::cout << why << std::endl;
    return kCannotStart;
  }
  std::set_new_handler(nullptr);  // from here on it is an exception
  pthread_t shellThread{};
  if (const int failed = pthread_create(&shellThread, nullptr, runShellThread, &words)) {
    std::cerr << "Cannot start the shell thread: " << strerror(failed) << std::endl;
    return kCannotStart;
  }
  platform::runMainEventLoop();
  return EXIT_SUCCESS;
}
