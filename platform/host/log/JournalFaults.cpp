#include "platform/host/log/JournalFaults.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdint>

namespace host {
namespace {

// What the handler reads is set before it is installed. It may be called on any thread.
constinit thread_local JournalFaults* ofThisThread = nullptr;
struct sigaction before = {};

/// Reads /proc/self/maps (see proc(5)) byte by byte, with nothing but system calls.
class MapsFile {
 public:
  MapsFile() : descriptor(::open("/proc/self/maps", O_RDONLY | O_CLOEXEC)) {}
  MapsFile(const MapsFile&) = delete;
  MapsFile& operator=(const MapsFile&) = delete;
  ~MapsFile() {
    if (descriptor >= 0) ::close(descriptor);
  }

  /// The next byte; 0 at the end.
  char next() {
    if (position == count) {
      count = descriptor >= 0 ? ::read(descriptor, buffer.data(), buffer.size()) : 0;
      position = 0;
    }
    return count > 0 ? buffer[static_cast<std::size_t>(position++)] : '\0';
  }

  /// The hexadecimal number at the position, and the byte after it, which is consumed.
  std::uintptr_t nextNumber() {
    std::uintptr_t number = 0;
    for (;;) {
      const char byte = next();
      if (byte >= '0' && byte <= '9') {
        number = number * 16 + static_cast<std::uintptr_t>(byte - '0');
      } else if (byte >= 'a' && byte <= 'f') {
        number = number * 16 + static_cast<std::uintptr_t>(byte - 'a' + 10);
      } else {
        return number;
      }
    }
  }

 private:
  int descriptor;
  std::array<char, 4096> buffer{};
  ssize_t position = 0;
  ssize_t count = 0;
};

/// Whether `address` lies in a shared map of the process. A line is "START-END rwxs ...".
bool isInSharedMap(const void* place) {
  const auto address = reinterpret_cast<std::uintptr_t>(place);
  MapsFile maps;
  for (;;) {
    const std::uintptr_t start = maps.nextNumber();
    const std::uintptr_t end = maps.nextNumber();
    if (end == 0) return false;
    for (int i = 0; i < 3; ++i) maps.next();
    const bool shared = maps.next() == 's';
    if (address >= start && address < end) return shared;
    for (char byte = maps.next(); byte != '\n'; byte = maps.next()) {
      if (byte == '\0') return false;
    }
  }
}

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
  if (ofThisThread != nullptr && info->si_code == BUS_ADRERR && isInSharedMap(info->si_addr) &&
      putEmptyPage(info->si_addr)) {
    ofThisThread->faults = 1;
  } else {
    ::sigaction(signal, &before, nullptr);
    ::raise(signal);  // blocked until this handler returns
  }
  errno = error;
}

}  // namespace host
