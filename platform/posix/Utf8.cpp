#include "platform/posix/Utf8.h"

#include <array>

namespace posix {
namespace {

constexpr char32_t kReplacement = 0xFFFD;
constexpr std::string_view kReplacementText = "\xEF\xBF\xBD";

struct Sequence {
  std::size_t length;
  char32_t code;
  bool wellFormed;
};

/// The sequence at the start of `text`: of an ill-formed one its maximal subpart, with the
/// replacement character for its code.
Sequence firstSequence(std::string_view text) {
  constexpr std::array<unsigned char, 5> kLeadBits = {0, 0x7F, 0x1F, 0x0F, 0x07};
  const auto lead = static_cast<unsigned char>(text[0]);
  const std::size_t length = utf8Length(text[0]);
  if (length == 0) return {1, kReplacement, false};
  char32_t code = lead & kLeadBits[length];
  // The second byte excludes overlong forms, surrogates and codes beyond U+10FFFF.
  unsigned char low = 0x80;
  unsigned char high = 0xBF;
  if (lead == 0xE0) low = 0xA0;
  if (lead == 0xED) high = 0x9F;
  if (lead == 0xF0) low = 0x90;
  if (lead == 0xF4) high = 0x8F;
  for (std::size_t i = 1; i < length; ++i) {
    if (i == text.size()) return {i, kReplacement, false};
    const auto byte = static_cast<unsigned char>(text[i]);
    if (byte < low || byte > high) return {i, kReplacement, false};
    code = (code << 6) | (byte & 0x3FU);
    low = 0x80;
    high = 0xBF;
  }
  return {length, code, true};
}

/// Whether all of `text` is ASCII. The loop has no early exit, so that it can be vectorized.
bool isAscii(std::string_view text) {
  unsigned char seen = 0;
  for (const char byte : text) seen |= static_cast<unsigned char>(byte);
  return seen < 0x80;
}

}  // namespace

std::size_t utf8Length(char lead) {
  const auto byte = static_cast<unsigned char>(lead);
  if (byte < 0x80) return 1;
  if (byte < 0xC2) return 0;
  if (byte < 0xE0) return 2;
  if (byte < 0xF0) return 3;
  return byte < 0xF5 ? 4 : 0;
}

bool isUtf8(std::string_view text) {
  if (isAscii(text)) return true;
  while (!text.empty()) {
    const Sequence sequence = firstSequence(text);
    if (!sequence.wellFormed) return false;
    text.remove_prefix(sequence.length);
  }
  return true;
}

std::string_view asUtf8(std::string_view text, std::string& storage) {
  if (isUtf8(text)) return text;
  storage.clear();
  while (!text.empty()) {
    const Sequence sequence = firstSequence(text);
    storage += sequence.wellFormed ? text.substr(0, sequence.length) : kReplacementText;
    text.remove_prefix(sequence.length);
  }
  return storage;
}

char32_t takeCodePoint(std::string_view& text) {
  const Sequence sequence = firstSequence(text);
  text.remove_prefix(sequence.length);
  return sequence.code;
}

}  // namespace posix
