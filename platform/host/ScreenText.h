#pragma once

#include <string>
#include <string_view>
#include <vector>

/// What a terminal shows of bytes, whatever the locale: UTF-8 as it is, and U+FFFD for control
/// characters, ill-formed sequences and all else without a glyph. Threads: any.
namespace host {

/// A glyph with the combining characters on it.
struct Cell {
  std::string glyph;
  std::size_t columns;  ///< 1 or 2
  std::size_t bytes;    ///< of the text that it shows
};

std::vector<Cell> cellsOf(std::string_view text);

}  // namespace host
