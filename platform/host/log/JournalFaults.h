#pragma once

#include <csignal>

namespace host {

/// Lets a thread read journal files through systemd's library, which maps them, while they are
/// truncated. A page that is gone raises SIGBUS; as journalctl does, the handler puts an empty page
/// there, and notes it.
///
/// The handler of SIGBUS is installed with the first of these, and stays. It takes only a fault of
/// a thread that has one, at an address in a shared map of a file, which is how the library maps
/// journals and nothing else here is. Any other gives SIGBUS back to the handler before it, for
/// good.
///
/// Threads: it belongs to the thread that makes it. Of several on a thread, the last one takes the
/// fault; they go in the opposite order.
class JournalFaults {
 public:
  JournalFaults();
  JournalFaults(const JournalFaults&) = delete;
  JournalFaults& operator=(const JournalFaults&) = delete;
  ~JournalFaults();

  /// Whether a page was gone: what has been read since may be zeros.
  bool any() const { return faults != 0; }

 private:
  static void handle(int signal, siginfo_t* info, void* context);

  volatile std::sig_atomic_t faults = 0;
  JournalFaults* const outer;  ///< the one that the thread had before
};

}  // namespace host
