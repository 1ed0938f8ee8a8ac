#include "logdump/TraceProperty.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <limits>
#include <string_view>
#include <utility>

#include "platform/telephony.h"

namespace {

/// The mode that a word stands for.
std::optional<std::int32_t> ModeOfWord(const std::string& value) {
  static constexpr std::pair<std::string_view, std::int32_t> kModes[] = {
      {"false", 0}, {"off", 0}, {"no", 0},   {"true", 1},
      {"on", 1},    {"yes", 1}, {"full", 1}, {"lite", 2}};
  for (const auto& [word, mode] : kModes) {
    if (util::equal_nocase(value, word)) return mode;
  }
  return std::nullopt;
}

/// The base of a number, from its prefix. strtoll accepts more prefixes in newer C libraries.
int BaseOf(std::string_view number) {
  number.remove_prefix(std::min(number.find_first_not_of(" \t\n\v\f\r"), number.size()));
  if (number.starts_with('+') || number.starts_with('-')) number.remove_prefix(1);
  if (number.starts_with("0x") || number.starts_with("0X")) return 16;
  return number.starts_with('0') ? 8 : 10;
}

/// `value` as a signed 64-bit number, if all of it is one.
std::optional<std::int64_t> ReadNumber(const std::string& value) {
  char* end = nullptr;
  errno = 0;
  const std::int64_t number = std::strtoll(value.c_str(), &end, BaseOf(value));
  const bool isWhole = end != value.c_str() && end == value.c_str() + value.size();
  if (!isWhole || errno == ERANGE) return std::nullopt;
  return number;
}

}  // namespace

std::optional<std::int32_t> ParseTraceMode(const std::string& value) {
  if (const auto mode = ModeOfWord(value)) return mode;
  using Range = std::numeric_limits<std::int32_t>;
  const auto number = ReadNumber(value);
  if (!number || *number < Range::min() || *number > Range::max()) return std::nullopt;
  return static_cast<std::int32_t>(*number);
}

void parseBoolProperty(const std::string& value, bool& flag) {
  if (const auto mode = ModeOfWord(value)) {
    flag = *mode != 0;
  } else if (const auto number = ReadNumber(value); number && (*number == 0 || *number == 1)) {
    flag = *number == 1;
  }
}
