#include "platform/host/log/FoldedText.h"

#include <algorithm>

#include "platform/posix/Utf8.h"

namespace host {
namespace {

/// What each letter from U+00C0, and from U+1E00, on folds to.
constexpr std::u16string_view kLatin1ToExtendedB =
    u"aaaaaaæceeeeiiiiðnooooo×ouuuuyþßaaaaaaæceeeeiiiiðnooooo÷ouuuuyþyaaaaaaccccccccdd"
    u"ddeeeeeeeeeegggggggghhhhiiiiiiiiiıĳĳjjkkĸllllllllllnnnnnnŉŋŋooooooœœrrrrrrssssss"
    u"ssttttttuuuuuuuuuuuuwwyyyzzzzzzsbbbbƅƅɔccddddƍǝəɛffgɣƕɩikklƛɯnnoooƣƣppʀƨƨʃƪttttu"
    u"uʊvyyzzʒƹƹƺƻƽƽƾƿǀǁǂǃǆǆǆǉǉǉǌǌǌaaiioouuuuuuuuuuǝaaaaææggggkkooooʒʒjǳǳǳggƕƿnnaaææoo"
    u"aaaaeeeeiiiioooorrrruuuussttȝȝhhndȣȣzzaaeeooooooooyylntȷȸȹaccltszɂɂbʉʌeejjqqrryy";
constexpr std::u16string_view kExtendedAdditional =
    u"aabbbbbbccddddddddddeeeeeeeeeeffgghhhhhhhhhhiiiikkkkkkllllllllmmmmmmnnnnnnnnoooo"
    u"oooopppprrrrrrrrssssssssssttttttttuuuuuuuuuuvvvvwwwwwwwwwwxxxxyyzzzzzzhtwyasẜẝßẟ"
    u"aaaaaaaaaaaaaaaaaaaaaaaaeeeeeeeeeeeeeeeeiiiioooooooooooooooooooooooouuuuuuuuuuuu"
    u"uuyyyyyyyyỻỻỽỽyy";

/// Letters outside those two ranges that are the other case of one inside, and what they fold to.
constexpr std::u32string_view kOutside = U"ɓɖɗɠɨɲɵʈʋⱥⱦⱾⱿ";
constexpr std::u32string_view kOutsideBase = U"bddginotvatsz";
static_assert(kOutside.size() == kOutsideBase.size());

constexpr char32_t kFirstMark = 0x300;
constexpr char32_t kLastMark = 0x36F;

constexpr bool isAscii(char32_t code) { return code < 0x80; }

/// True when `letters`, which begin with those of `first`, have one for `code`.
constexpr bool covers(std::u16string_view letters, char32_t first, char32_t code) {
  return code >= first && code - first < letters.size();
}

constexpr char32_t kLatin1First = 0xC0;
constexpr char32_t kAdditionalFirst = 0x1E00;
static_assert(covers(kLatin1ToExtendedB, kLatin1First, 0x24F));
static_assert(!covers(kLatin1ToExtendedB, kLatin1First, 0x250));
static_assert(covers(kExtendedAdditional, kAdditionalFirst, 0x1EFF));
static_assert(!covers(kExtendedAdditional, kAdditionalFirst, 0x1F00));

char32_t baseLetter(char32_t code) {
  if (isAscii(code)) return static_cast<unsigned char>(posix::lowered(static_cast<char>(code)));
  if (covers(kLatin1ToExtendedB, kLatin1First, code)) {
    return kLatin1ToExtendedB[code - kLatin1First];
  }
  if (covers(kExtendedAdditional, kAdditionalFirst, code)) {
    return kExtendedAdditional[code - kAdditionalFirst];
  }
  const auto outside = kOutside.find(code);
  return outside == kOutside.npos ? code : kOutsideBase[outside];
}

std::u32string fold(std::string_view text) {
  std::u32string folded;
  while (!text.empty()) {
    const char32_t code = posix::takeCodePoint(text);
    if (code < kFirstMark || code > kLastMark) folded += baseLetter(code);
  }
  return folded;
}

}  // namespace

FoldedText::FoldedText(std::string_view text) : folded(fold(text)) {}

bool FoldedText::isIn(std::string_view text) const {
  const auto ascii = [](char byte) { return isAscii(static_cast<unsigned char>(byte)); };
  if (!std::ranges::all_of(text, ascii)) return fold(text).find(folded) != folded.npos;
  // Nearly every path: compared in place.
  const auto same = [](char theirs, char32_t ours) {
    return baseLetter(static_cast<unsigned char>(theirs)) == ours;
  };
  return folded.empty() ||
         std::search(text.begin(), text.end(), folded.begin(), folded.end(), same) != text.end();
}

}  // namespace host
