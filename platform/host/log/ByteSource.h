#pragma once

#include <cstddef>
#include <optional>

namespace host {

/// Where the bytes of a log come from.
class ByteSource {
 public:
  virtual ~ByteSource() = default;

  /// Puts the next bytes, at most `size` (which is not 0), into `buffer` and returns their number:
  /// 0 at the end, nothing when the reader has been asked to stop. May block. Throws
  /// `std::system_error` when the rest cannot be had. Only after a number above 0 may it be called
  /// again.
  virtual std::optional<std::size_t> read(char* buffer, std::size_t size) = 0;
};

}  // namespace host
