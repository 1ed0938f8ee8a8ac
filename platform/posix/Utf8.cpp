#include "platform/posix/Utf8.h"

#include <array>
#include <cstdint>
#include <cstring>

namespace posix {
namespace {

constexpr char32_t kReplacement = 0xFFFD;

struct Sequence {
  std::size_t length;
  bool wellFormed;
};

/// The length that a lead byte announces; 0 for a byte that leads nothing.
std::size_t announcedLength(unsigned char lead) {
  if (lead < 0x80) return 1;
  if (lead < 0xC2) return 0;
  if (lead < 0xE0) return 2;
  if (lead < 0xF0) return 3;
  return lead < 0xF5 ? 4 : 0;
}

/// The well-formed sequence at the start of `text`, or the maximal subpart of an ill-formed one.
Sequence firstSequence(std::string_view text) {
  const auto lead = static_cast<unsigned char>(text[0]);
  const std::size_t length = announcedLength(lead);
  if (length == 0) return {1, false};
  // What excludes overlong forms, surrogates and the codes beyond U+10FFFF is the second byte.
  unsigned char low = lead == 0xE0 ? 0xA0 : lead == 0xF0 ? 0x90 : 0x80;
  unsigned char high = lead == 0xED ? 0x9F : lead == 0xF4 ? 0x8F : 0xBF;
  for (std::size_t i = 1; i < length; ++i) {
    if (i == text.size()) return {i, false};
    const auto byte = static_cast<unsigned char>(text[i]);
    if (byte < low || byte > high) return {i, false};
    low = 0x80;
    high = 0xBF;
  }
  return {length, true};
}

/// Whether `text` is ASCII throughout: eight bytes at a time, the last eight perhaps twice.
bool isAscii(std::string_view text) {
  constexpr std::uint64_t kHighBits = 0x8080808080808080U;
  std::uint64_t seen = 0;
  if (text.empty()) return true;
  if (text.size() < sizeof seen) {
    std::memcpy(&seen, text.data(), text.size());
    return (seen & kHighBits) == 0;
  }
  std::uint64_t word = 0;
  for (std::size_t i = 0; i + sizeof word < text.size(); i += sizeof word) {
    std::memcpy(&word, text.data() + i, sizeof word);
    seen |= word;
  }
  std::memcpy(&word, text.data() + text.size() - sizeof word, sizeof word);
  return ((seen | word) & kHighBits) == 0;
}

/// The length of the longest well-formed beginning of `text`.
std::size_t wellFormedLength(std::string_view text) {
  if (isAscii(text)) return text.size();
  std::size_t length = 0;
  while (length < text.size()) {
    const Sequence sequence = firstSequence(text.substr(length));
    if (!sequence.wellFormed) break;
    length += sequence.length;
  }
  return length;
}

}  // namespace

bool isUtf8(std::string_view text) { return wellFormedLength(text) == text.size(); }

std::string_view asUtf8(std::string_view text, std::string& storage) {
  std::size_t good = wellFormedLength(text);
  if (good == text.size()) return text;
  storage.clear();
  while (!text.empty()) {
    storage.append(text.substr(0, good));
    text.remove_prefix(good);
    if (!text.empty()) appendUtf8(storage, takeCodePoint(text));
    good = wellFormedLength(text);
  }
  return storage;
}

char32_t takeCodePoint(std::string_view& text) {
  const Sequence sequence = firstSequence(text);
  char32_t code = kReplacement;
  if (sequence.wellFormed) {
    constexpr std::array<unsigned char, 5> kLeadBits = {0, 0x7F, 0x1F, 0x0F, 0x07};
    code = static_cast<unsigned char>(text[0]) & kLeadBits[sequence.length];
    for (std::size_t i = 1; i < sequence.length; ++i) {
      code = (code << 6) | (static_cast<unsigned char>(text[i]) & 0x3FU);
    }
  }
  text.remove_prefix(sequence.length);
  return code;
}

void appendUtf8(std::string& text, char32_t codePoint) {
  const auto tail = [codePoint](unsigned shift) {
    return static_cast<char>(0x80U | ((codePoint >> shift) & 0x3FU));
  };
  if (codePoint < 0x80) {
    text += static_cast<char>(codePoint);
  } else if (codePoint < 0x800) {
    text += {static_cast<char>(0xC0U | (codePoint >> 6)), tail(0)};
  } else if (codePoint < 0x10000) {
    text += {static_cast<char>(0xE0U | (codePoint >> 12)), tail(6), tail(0)};
  } else {
    text += {static_cast<char>(0xF0U | (codePoint >> 18)), tail(12), tail(6), tail(0)};
  }
}

}  // namespace posix
