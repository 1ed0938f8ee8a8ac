#pragma once

#include <chrono>
#include <list>
#include <string>

/// Copies the recent history of the system log into a text file, one line for each log message:
/// date in local time, thread, activity, process identifier, process(sender):subsystem [category]
/// message.
///
/// Has no instances. Its diagnostics go to the system log, never to the terminal.
class OsLogStream {
 public:
  OsLogStream() = delete;

  /// Makes the file at `path` or empties the one that is there, and appends a line for each message
  /// of the last `history` seconds that a process named in `process` logged, or an image whose path
  /// contains one of `imagePath`, whatever case and accents; every message when both lists are
  /// empty. Blocks until the log has been copied, or 180 seconds have passed.
  ///
  /// Returns true when the log store ended the stream in time; the system log has the reason if
  /// that was before the end of the log. Returns false, with the reason in the system log, when the
  /// log or the file cannot be opened, a line cannot be written whole, or the time is up; lines
  /// written until then stay.
  /// Threads: any; a call keeps nothing for the next.
  [[nodiscard]] static bool putOsLogStreamToFile(const std::string& path,
                                                 const std::list<std::string>& process,
                                                 const std::list<std::string>& imagePath,
                                                 double history);

 private:
  friend struct OsLogStreamClock;  // lets a test wait for less than 180 seconds

  static constexpr std::chrono::seconds kTimeout{180};
  static bool putWithin(std::chrono::nanoseconds timeout, const std::string& path,
                        const std::list<std::string>& process,
                        const std::list<std::string>& imagePath, double history);
};
