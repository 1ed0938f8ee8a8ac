#include "platform/host/ProcessName.h"

#include <algorithm>

namespace host {
namespace {

constexpr std::size_t kKernelLimit = 15;
constexpr std::string_view kDeleted = " (deleted)";

struct Escape {
  char byte;
  std::size_t length;
};

bool isOctal(char letter) { return letter >= '0' && letter <= '7'; }

/// The escape sequence at the start of `text`, or its first byte as it is.
Escape firstEscape(std::string_view text) {
  constexpr std::string_view kLetters = "abfnrtv\\\"'";
  constexpr std::string_view kMeanings = "\a\b\f\n\r\t\v\\\"'";
  if (text[0] != '\\') return {text[0], 1};
  if (text.size() >= 2 && kLetters.find(text[1]) != std::string_view::npos) {
    return {kMeanings[kLetters.find(text[1])], 2};
  }
  if (text.size() >= 4 && text[1] <= '3' && std::ranges::all_of(text.substr(1, 3), isOctal)) {
    return {static_cast<char>((text[1] - '0') * 64 + (text[2] - '0') * 8 + (text[3] - '0')), 4};
  }
  return {text[0], 1};
}

}  // namespace

std::string_view fileName(std::string_view path) { return path.substr(path.rfind('/') + 1); }

std::string_view processName(std::string_view comm, std::string_view exePath) {
  if (comm.size() != kKernelLimit) return comm;
  if (exePath.ends_with(kDeleted)) exePath.remove_suffix(kDeleted.size());
  const std::string_view file = fileName(exePath);
  return file.starts_with(comm) ? file : comm;
}

std::string_view unescaped(std::string_view escaped, std::string& storage) {
  if (escaped.find('\\') == std::string_view::npos) return escaped;
  storage.clear();
  while (!escaped.empty()) {
    const Escape escape = firstEscape(escaped);
    storage += escape.byte;
    escaped.remove_prefix(escape.length);
  }
  return storage;
}

}  // namespace host
