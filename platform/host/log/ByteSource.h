#pragma once

#include <cstddef>
#include <cstdint>

namespace host {

/// Where the bytes of a log come from. Threads: one at a time.
class ByteSource {
 public:
  /// What `read` returns in place of a number of bytes.
  static constexpr std::int64_t kEnd = 0;
  static constexpr std::int64_t kFailed = -1;   ///< the rest cannot be had
  static constexpr std::int64_t kStopped = -2;  ///< the reader has been asked to stop

  virtual ~ByteSource() = default;

  /// Puts the next bytes, at most `size` (which is not 0), into `buffer` and returns their number;
  /// or one of the above, after which it is not called again. May block.
  virtual std::int64_t read(char* buffer, std::size_t size) = 0;
};

}  // namespace host
