#pragma once

#include <iostream>
#include <sstream>

/// What the program prints on standard output while this lives, a "$" where it flushes.
class CapturedOutput : public std::stringbuf {
 public:
  CapturedOutput() : before(std::cout.rdbuf(this)) {}
  ~CapturedOutput() override { std::cout.rdbuf(before); }

 private:
  int sync() override {
    sputc('$');
    return 0;
  }
  std::streambuf* before;
};
