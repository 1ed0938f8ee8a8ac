#include <pthread.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <iostream>

#include "platform/system.h"
#include "platform/telephony.h"
#include "tool/Hardware.h"
#include "tool/ZUBShell.h"

namespace {

constexpr int kCannotStart = -1;  // status 255

int refuse(const char* why) {
  std::cout << why << std::endl;
  return kCannotStart;
}

/// Whether the daemons that the tool reports on are there. A watch may do without them.
bool daemonsAreRunning() {
  const bool telephony = tlu::isProcessRunning("Orvalind");
  const bool watch = config::hw::watch();
  return telephony || watch || tlu::isProcessRunning("modemd");
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
  auto words = CommandShell::convertCmdArgsToList(argc, argv);
  if (TelephonyRadiosGetRadio() == 0) return refuse("'zubtool' is not supported on this product.");
  if (!daemonsAreRunning()) {
    return refuse(
        "Orvalind process is not running. Please run/load Orvalind (or modemd) and try again.");
  }
  // A reader that goes away costs the output, not the collection.
  signal(SIGPIPE, SIG_IGN);
  std::ios::sync_with_stdio(false);
  pthread_t shellThread{};
  if (const int failed = pthread_create(&shellThread, nullptr, runShellThread, &words)) {
    std::cerr << "Cannot start the shell thread: " << strerror(failed) << std::endl;
    return kCannotStart;
  }
  platform::runMainEventLoop();
  return EXIT_SUCCESS;
}
