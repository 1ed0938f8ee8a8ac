#pragma once

#include <unistd.h>

#include <utility>

namespace posix {

/// Owns an open file descriptor, or none (-1), and closes it.
class Descriptor {
 public:
  explicit Descriptor(int opened = -1) noexcept : number(opened) {}
  Descriptor(Descriptor&& other) noexcept : number(std::exchange(other.number, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(number, other.number);
    return *this;
  }
  ~Descriptor() {
    if (number >= 0) ::close(number);
  }

  int get() const noexcept { return number; }

  /// Leaves it open, to whoever owns it now.
  void release() noexcept { number = -1; }

  explicit operator bool() const noexcept { return number >= 0; }

 private:
  int number;
};

}  // namespace posix
