#pragma once

#include <string>
#include <string_view>

namespace posix {

/// The lower-case letter of an ASCII capital, whatever the locale; any other byte unchanged.
constexpr char lowered(char letter) {
  return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
}

// UTF-8 as the Unicode standard defines it: no overlong forms, no surrogates, nothing beyond
// U+10FFFF. These functions take any bytes.

/// True when all of `text` is well-formed. Fast for ASCII.
bool isUtf8(std::string_view text);

/// Returns `text` itself when it is well-formed. Otherwise returns a copy, made in `storage`, with
/// U+FFFD for each maximal subpart of an ill-formed sequence, as the Unicode standard recommends.
/// The result refers to `text` or `storage`; `text` must not lie in `storage`.
std::string_view asUtf8(std::string_view text, std::string& storage);

/// The length in bytes of the sequence that `lead` starts; 0 for a byte that starts none.
std::size_t utf8Length(char lead);

/// Removes the first code point from `text`, which must not be empty, and returns it: U+FFFD for an
/// ill-formed sequence, divided as above.
char32_t takeCodePoint(std::string_view& text);

}  // namespace posix
