#pragma once

#include <csignal>

/// The terminal of standard input while a line is edited on it: the one place that knows what its
/// settings were before, and sees to it that they are back whenever somebody else has the terminal.
///
/// The signals that end or stop the process do so as ever, but after the settings are back; so does
/// exit(3) on any thread. On the thread that edits they are blocked except while it waits for
/// input, so that no change of the settings is under way then; on another thread they wait for
/// that moment, a fifth of a second at most. Nothing is sent to any other process.
///
/// Threads: one session at a time, on one thread.
namespace host {

class TerminalSession {
 public:
  enum class Event {
    input,      ///< there is something to read, or the input has ended
    timeout,    ///< nothing to read in time
    resized,    ///< the terminal has, perhaps, another size
    continued,  ///< the process was stopped: the cursor is anywhere
  };

  /// Waits until the process has the terminal, as a read would, and remembers the settings.
  TerminalSession();
  TerminalSession(const TerminalSession&) = delete;
  TerminalSession& operator=(const TerminalSession&) = delete;

  /// Puts the settings back.
  ~TerminalSession();

  /// Waits for input for `milliseconds`, or without end for -1. The settings of the terminal that
  /// it finds are those for editing; it sets them anew when the process goes on after a stop.
  Event wait(int milliseconds);

 private:
  sigset_t signalsBefore{};
};

}  // namespace host
