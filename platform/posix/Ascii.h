#pragma once

namespace posix {

/// The small letter of an ASCII capital; any other byte as it is, whatever the locale.
constexpr char lowered(char letter) {
  return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
}

}  // namespace posix
