#pragma once

#include <csignal>

namespace host {

/// Lets a thread read journal files through systemd's library, which maps them, while others
/// truncate them. Access to a page that is gone raises SIGBUS; the handler puts an empty page
/// there, as journalctl does, and notes the fault.
///
/// The handler is installed with the first object, and stays. It takes a fault of a missing page
/// (BUS_ADRERR) on a thread that has an object: such a thread maps no files but journals. Any other
/// SIGBUS is left to the handler before it, from then on for good.
///
/// Threads: an object belongs to the thread that makes it. The last one made takes the faults;
/// objects of one thread are destroyed in the opposite order.
class JournalFaults {
 public:
  JournalFaults();
  JournalFaults(const JournalFaults&) = delete;
  JournalFaults& operator=(const JournalFaults&) = delete;
  ~JournalFaults();

  /// Whether a page was gone. What has been read since may be zeros.
  bool any() const { return faults != 0; }

 private:
  static void handle(int signal, siginfo_t* info, void* context);

  volatile std::sig_atomic_t faults = 0;
  JournalFaults* const outer;  ///< the one that the thread had before
};

}  // namespace host
