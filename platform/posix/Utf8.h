#pragma once

#include <string>
#include <string_view>

/// UTF-8 as the Unicode standard defines it: no overlong forms, no surrogates, nothing beyond
/// U+10FFFF. Every function takes any bytes.
namespace posix {

/// True when all of `text` is well-formed. Runs of ASCII cost next to nothing.
bool isUtf8(std::string_view text);

/// `text` itself where it is well-formed. Otherwise a copy, made in `storage`, that has U+FFFD for
/// each ill-formed sequence: for each maximal subpart of one, as the Unicode standard recommends.
/// The result is valid as long as what it refers to; `text` must not lie in `storage`.
std::string_view asUtf8(std::string_view text, std::string& storage);

/// The length in bytes of the sequence that `lead` starts; 0 for a byte that starts none.
std::size_t utf8Length(char lead);

/// Takes the first code point off `text`, which must not be empty. An ill-formed sequence is taken
/// as one U+FFFD, divided as above.
char32_t takeCodePoint(std::string_view& text);

/// Appends `codePoint`, which must be one that UTF-8 can express.
void appendUtf8(std::string& text, char32_t codePoint);

}  // namespace posix
