#pragma once

#include <iostream>
#include <sstream>

/// What the program prints on standard output while this lives, a "$" where it flushes.
class CapturedOutput : public std::stringbuf {
 public:
  explicit CapturedOutput(bool marksFlushes = false)
      : marks(marksFlushes), before(std::cout.rdbuf(this)) {}
  ~CapturedOutput() override { std::cout.rdbuf(before); }

 private:
  int sync() override {
    if (marks) sputc('$');
    return 0;
  }
  bool marks;
  std::streambuf* before;
};
