#pragma once

#include <csignal>
#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "platform/posix/SignalMask.h"

namespace host {

/// The signals that, as their dispositions stand, end or stop the process when it is sent one: none
/// that it ignores or handles, and none of a fault of its own.
std::vector<int> endingSignals();

/// Has `signal`, which has no handler, take effect on the calling thread. Returns where it has only
/// stopped the process, which has gone on. Safe in a handler of signals.
void takeEffect(int signal);

/// Whether no other job has the terminal of `descriptor`.
bool hasTerminal(int descriptor);

/// Whether the terminal of `descriptor` takes output at once: Ctrl-S has not stopped it.
bool takesOutput(int descriptor);

/// Whether `descriptor` is a terminal that can move its cursor: TERM is set, and is not "dumb".
bool canMoveCursor(int descriptor);

struct TerminalSize {
  std::size_t rows;
  std::size_t columns;
};

/// Of the terminal of standard output; 24 rows of 80 columns where it does not say.
TerminalSize sizeOfTerminal();

/// The terminal of standard input while a line is edited on it: the one place that knows what its
/// settings were before, and sees to it that they are back whenever somebody else has the terminal.
///
/// The signals that end or stop the process do so as ever, but after the settings are back. They
/// are blocked except while this waits or writes, so that no change of the settings is under way
/// then. Nothing is sent to any other process.
///
/// Threads: one session at a time, on one thread; the others block those signals.
class TerminalSession {
 public:
  enum class Event {
    input,      ///< there is something to read, or the input has ended
    timeout,    ///< nothing to read in time
    resized,    ///< the terminal has, perhaps, another size
    continued,  ///< the process was stopped: the cursor is anywhere
  };

  /// Waits until the process has the terminal, as a read would, and sets it to give each key as it
  /// is typed, and a paste between marks.
  TerminalSession();

  /// Puts the settings back.
  ~TerminalSession();

  /// Waits for input for `milliseconds`, or without end for -1. The process has the terminal when
  /// it returns.
  Event wait(int milliseconds);

  /// Appends the next byte to `bytes`, and no more: what follows the line may be for another
  /// program. False at the end of the input. Ctrl-D that was typed before the session is one all
  /// the same: the system keeps it as a NUL.
  bool read(std::string& bytes);

  void write(std::string_view text);

 private:
  void enter();

  const std::vector<int> ending = endingSignals();
  const posix::SignalMask blocked;
  int typedAhead = 0;  // bytes
};

}  // namespace host
