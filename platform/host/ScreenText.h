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

  friend bool operator==(const Cell&, const Cell&) = default;
};

std::vector<Cell> cellsOf(std::string_view text);
std::size_t columnsOf(const std::vector<Cell>& cells);

/// The length in bytes of the part of `text`, which must not be empty, that its first cell shows.
std::size_t firstLength(std::string_view text);

}  // namespace host
