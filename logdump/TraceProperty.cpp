#include "logdump/TraceProperty.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <limits>
#include <string_view>

#include "platform/telephony.h"

namespace {

enum class Word { none, off, on, full, lite };

Word ReadWord(const std::string& value) {
  static constexpr struct {
    const char* text;
    Word word;
  } kWords[] = {{"false", Word::off}, {"off", Word::off},  {"no", Word::off},
                {"true", Word::on},   {"on", Word::on},    {"yes", Word::on},
                {"full", Word::full}, {"lite", Word::lite}};
  for (const auto& [text, word] : kWords) {
    if (util::equal_nocase(value, text)) return word;
  }
  return Word::none;
}

/// The base that the prefix of a number means. Not left to strtoll, which knows more prefixes in
/// newer C libraries.
int BaseOf(std::string_view number) {
  number.remove_prefix(std::min(number.find_first_not_of(" \t\n\v\f\r"), number.size()));
  if (number.starts_with('+') || number.starts_with('-')) number.remove_prefix(1);
  if (number.starts_with("0x") || number.starts_with("0X")) return 16;
  return number.starts_with('0') ? 8 : 10;
}

/// All of `value` as a signed 64-bit number.
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
  switch (ReadWord(value)) {
    case Word::off:
      return 0;
    case Word::on:
    case Word::full:
      return 1;
    case Word::lite:
      return 2;
    case Word::none:
      break;
  }
  using Range = std::numeric_limits<std::int32_t>;
  const auto number = ReadNumber(value);
  if (!number || *number < Range::min() || *number > Range::max()) return std::nullopt;
  return static_cast<std::int32_t>(*number);
}

void parseBoolProperty(const std::string& value, bool& flag) {
  const auto word = ReadWord(value);
  const auto number = word == Word::none ? ReadNumber(value) : std::nullopt;
  if (word == Word::off || number == 0) flag = false;
  if (word == Word::on || word == Word::full || word == Word::lite || number == 1) flag = true;
}
