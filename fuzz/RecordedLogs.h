#pragma once

#include <algorithm>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

/// An entry's binary field, whose declared length may be another than its own.
inline std::string binary(const std::string& name, const std::string& value,
                          std::optional<std::uint64_t> declared = {}) {
  const auto length = declared.value_or(value.size());
  std::string text = name + '\n';
  for (int i = 0; i < 8; ++i) text += static_cast<char>(length >> (8 * i));
  return text + value + '\n';
}

/// Gives the bytes of a log, `most` at a time.
inline auto pieces(std::string_view log, std::size_t most) {
  return [log, most](char* buffer, std::size_t size) mutable {
    const std::size_t count = log.copy(buffer, std::min(size, most));
    log.remove_prefix(count);
    return std::optional(count);
  };
}
