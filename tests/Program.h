#pragma once

#include <sys/types.h>
#include <termios.h>

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

/// A folder of its own under the system's temporary folder, removed with all that is in it.
class ScratchFolder {
 public:
  ScratchFolder();
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;
  ~ScratchFolder();

  std::string path(const std::string& name) const { return folder / name; }

 private:
  std::filesystem::path folder;
};

std::string readFile(const std::string& path);
void writeFile(const std::string& path, const std::string& text);

/// One start of the real program.
struct Start {
  std::vector<std::string> words = {};  ///< after the program's name
  std::string profile = {};             ///< text of the device profile
  std::string input = {};               ///< standard input
  std::string name = "zubtool";         ///< under which the program is invoked
  bool onTerminal = false;              ///< a pseudo-terminal stands for all three standard streams
  std::string term = "dumb";            ///< the kind of terminal, TERM
  std::string shell = {};  ///< a script of sh(1) with job control that runs it, as "$@"
};

/// What one run of the program left behind.
struct Outcome {
  std::string out = {};
  std::string err = {};
  int status = 0;  ///< exit status, or 1000 and the signal that ended it
  std::string requests = {};
};

/// Compares each part by itself, so that the lines which differ are shown.
void expectOutcome(const Outcome& actual, const Outcome& expected);

/// A started program. Its standard input and output are a socket, or a terminal with standard
/// error.
class Program {
 public:
  explicit Program(const Start& start);

  /// Writes `text` to its standard input; of small texts, all before it reads.
  void type(const std::string& text) const;

  /// What it prints on standard output up to and with `end`, or to its own end.
  std::string readUntil(const std::string& end) const;

  /// Ends its standard input and waits for its end. Called once.
  Outcome finish();

  /// The settings of a terminal that a program is started on.
  static termios terminalBefore();

  pid_t pid() const { return process; }
  int terminal() const { return streams; }  ///< its controlling side, where the program has one

 private:
  [[noreturn]] void execute(const Start& start, int end) const;

  std::shared_ptr<ScratchFolder> scratch = std::make_shared<ScratchFolder>();
  int streams = -1;  // the other end of its standard streams
  pid_t process = -1;
};

inline Outcome run(const Start& start) { return Program(start).finish(); }
