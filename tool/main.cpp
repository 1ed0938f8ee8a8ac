#include <pthread.h>

#include <cstdlib>
#include <cstring>
#include <iostream>

#include "platform/system.h"
#include "tool/StartUpChecks.h"
#include "tool/ZUBShell.h"

namespace {

constexpr int kCannotStart = -1;  // status 255

/// The shell thread. `words` is the command line's word list, which outlives the thread.
extern "C" void* runShellThread(void* words) {
  const auto commandLine = *static_cast<const std::list<std::string>*>(words);
  const std::shared_ptr<CommandShell> shell(new ZUBShell);
  const bool succeeded = shell->run(commandLine);
  std::exit(succeeded ? EXIT_SUCCESS : EXIT_FAILURE);  // with the shell and its tree alive
}

}  // namespace

int main(int argc, char** argv) {
  platform::openStandardStreams();
  auto words = CommandShell::convertCmdArgsToList(argc, argv);
  if (const char* const why = WhyNotToStart()) {
    std::cout << why << std::endl;
    return kCannotStart;
  }
  pthread_t shellThread{};
  if (const int failed = pthread_create(&shellThread, nullptr, runShellThread, &words)) {
    std::cerr << "Cannot start the shell thread: " << strerror(failed) << std::endl;
    return kCannotStart;
  }
  platform::runMainEventLoop();
  return EXIT_SUCCESS;
}
