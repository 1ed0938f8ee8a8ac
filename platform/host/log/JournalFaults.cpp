#include "platform/host/log/JournalFaults.h"

#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>

namespace host {
namespace {

// What the handler reads is set before it is installed. It may be called on any thread.
constinit thread_local JournalFaults* ofThisThread = nullptr;
struct sigaction before = {};

/// Replaces the page around `address` by an empty one.
bool putEmptyPage(void* address) {
  const auto size = static_cast<std::uintptr_t>(::sysconf(_SC_PAGESIZE));
  void* const page = static_cast<char*>(address) - reinterpret_cast<std::uintptr_t>(address) % size;
  return ::mmap(page, size, PROT_READ, MAP_PRIVATE | MAP_ANONYMOUS | MAP_FIXED, -1, 0) == page;
}

}  // namespace

JournalFaults::JournalFaults() : outer(ofThisThread) {
  ofThisThread = this;
  [[maybe_unused]] static const bool kIsInstalled = [] {
    struct sigaction ours = {};
    ours.sa_sigaction = handle;
    ours.sa_flags = SA_SIGINFO;
    ::sigaction(SIGBUS, nullptr, &before);
    return ::sigaction(SIGBUS, &ours, nullptr) == 0;
  }();
}

JournalFaults::~JournalFaults() { ofThisThread = outer; }

void JournalFaults::handle(int signal, siginfo_t* info, void* /*context*/) {
  const int error = errno;
  if (ofThisThread != nullptr && info->si_code == BUS_ADRERR && putEmptyPage(info->si_addr)) {
    ofThisThread->faults = 1;
  } else {
    ::sigaction(signal, &before, nullptr);
    ::raise(signal);  // blocked until this handler returns
  }
  errno = error;
}

}  // namespace host
