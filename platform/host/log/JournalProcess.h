#pragma once

#include <sys/types.h>

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "platform/posix/Descriptor.h"

namespace host {

/// A journalctl that runs. It is found on the PATH and started without a shell, with nothing on its
/// standard input, with the signals as a new process expects them, and without the SYSTEMD_
/// variables of the environment. Should this process call exit first, it is killed; should
/// this process be killed, it ends at its next write.
///
/// Threads: one at a time.
class JournalProcess {
 public:
  /// Throws `std::system_error` when it cannot be started; with ENOENT it is not installed.
  explicit JournalProcess(const std::vector<std::string>& arguments);
  JournalProcess(const JournalProcess&) = delete;
  JournalProcess& operator=(const JournalProcess&) = delete;

  /// Asks it to stop if it still runs, forces it to after a second, and in any case reaps it.
  ~JournalProcess();

  /// Where its standard output can be read.
  int output() const { return standardOutput.get(); }

  /// What it has written to standard error so far and has not been asked for yet. What is beyond
  /// the size of a pipe is lost, so that it never waits for someone to read it.
  std::string messages();

  /// Waits until it has ended, for at most `timeout`: true when it has, by itself and with status
  /// 0; false when it has in any other way; nothing when it still runs.
  std::optional<bool> succeeded(std::chrono::milliseconds timeout);

 private:
  pid_t process = -1;
  std::optional<bool> success;  ///< once it has been reaped
  posix::Descriptor standardOutput;
  posix::Descriptor standardError;
};

}  // namespace host
