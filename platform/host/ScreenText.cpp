#include "platform/host/ScreenText.h"

#include <clocale>
#include <cwchar>

#include "platform/posix/Utf8.h"

namespace host {
namespace {

/// How many columns a code point takes: -1 for one without a glyph.
int columnsOf(char32_t codePoint) {
  static const locale_t utf8 = newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
  if (codePoint == U'\0') return -1;
  const locale_t before = uselocale(utf8);  // a null one changes nothing
  const int columns = wcwidth(static_cast<wchar_t>(codePoint));
  uselocale(before);
  return columns;
}

/// Takes the first cell off `text`, which must not be empty.
Cell takeCell(std::string_view& text) {
  const auto whole = text;
  const int columns = columnsOf(posix::takeCodePoint(text));
  auto rest = text;
  while (!rest.empty() && columnsOf(posix::takeCodePoint(rest)) == 0) text = rest;
  const auto bytes = whole.substr(0, whole.size() - text.size());
  if (columns <= 0) return {"\xEF\xBF\xBD", 1, bytes.size()};
  std::string storage;
  return {std::string(posix::asUtf8(bytes, storage)), static_cast<std::size_t>(columns),
          bytes.size()};
}

}  // namespace

std::vector<Cell> cellsOf(std::string_view text) {
  std::vector<Cell> cells;
  while (!text.empty()) cells.push_back(takeCell(text));
  return cells;
}

}  // namespace host
