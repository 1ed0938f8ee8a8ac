#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <iostream>

#include "platform/system.h"
#include "tool/StartUpChecks.h"
#include "tool/ZUBShell.h"

namespace {

constexpr int kCannotStart = -1;  // status 255

/// Puts the null device in the place of each standard stream that is closed, before anything else
/// is opened and taken for it.
void openStandardStreams() {
  for (int stream = STDIN_FILENO; stream <= STDERR_FILENO; ++stream) {
    if (fcntl(stream, F_GETFD) < 0) open("/dev/null", O_RDWR);
  }
}

/// The shell thread. `words` is the command line's word list, which outlives the thread.
extern "C" void* runShellThread(void* words) {
  const auto commandLine = *static_cast<const std::list<std::string>*>(words);
  const std::shared_ptr<CommandShell> shell(new ZUBShell);
  const bool succeeded = shell->run(commandLine);
  std::exit(succeeded ? EXIT_SUCCESS : EXIT_FAILURE);  // with the shell and its tree alive
}

}  // namespace

int main(int argc, char** argv) {
  openStandardStreams();
  // A reader that goes away, or a limit to a file's size, costs the output, not the collection or
  // the exit status.
  signal(SIGPIPE, SIG_IGN);
  signal(SIGXFSZ, SIG_IGN);
  auto words = CommandShell::convertCmdArgsToList(argc, argv);
  if (const char* const why = whyNotToStart()) {
    std::cout << why << std::endl;
    return kCannotStart;
  }
  std::ios::sync_with_stdio(false);
  pthread_t shellThread{};
  if (const int failed = pthread_create(&shellThread, nullptr, runShellThread, &words)) {
    std::cerr << "Cannot start the shell thread: " << strerror(failed) << std::endl;
    return kCannotStart;
  }
  platform::runMainEventLoop();
  return EXIT_SUCCESS;
}
