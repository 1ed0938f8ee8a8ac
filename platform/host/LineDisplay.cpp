#include "platform/host/LineDisplay.h"

#include <algorithm>
#include <string>

namespace host {
namespace {

struct Place {
  std::size_t row;
  std::size_t column;
};

/// Where the cells of a text stand, in rows of a number of columns.
struct Layout {
  Layout(const std::vector<Cell>& cells, std::size_t columns) : cells(cells) {
    std::size_t column = 0;
    for (std::size_t i = 0; i < cells.size(); ++i) {
      if (column > 0 && column + cells[i].columns > columns) {
        starts.push_back(i);
        column = 0;
      }
      column += cells[i].columns;
    }
    endsRow = column >= columns;
  }

  /// The place of the cell at `index`, or of what comes after them all.
  Place placeOf(std::size_t index) const {
    const auto next = std::ranges::upper_bound(starts, index);
    Place place = {static_cast<std::size_t>(next - starts.begin()) - 1, 0};
    for (auto i = *std::prev(next); i < index; ++i) place.column += cells[i].columns;
    return place;
  }

  const std::vector<Cell>& cells;
  std::vector<std::size_t> starts = {0};  // of each row, its first cell
  bool endsRow;                           // the last row is full
};

std::string control(std::size_t count, char function) {
  return count > 0 ? "\033[" + std::to_string(count) + function : "";
}

/// What moves the cursor there. It counts columns from the left, so that a glyph that the terminal
/// takes for wider or narrower does not matter beyond it.
std::string moving(Place from, Place to) {
  if (from.row == to.row && from.column == to.column) return "";
  return control(from.row - std::min(from.row, to.row), 'A') +
         control(to.row - std::min(from.row, to.row), 'B') + '\r' + control(to.column, 'C');
}

}  // namespace

void LineDisplay::draw(std::string_view text, std::size_t cursor) {
  const auto [height, columns] = sizeOfTerminal();
  auto cells = cellsOf(text);
  auto at = std::min(cellsOf(text.substr(0, cursor)).size(), cells.size());
  if (Layout(cells, columns).endsRow) cells.push_back({" ", 1});  // what the cursor stands on
  auto same = static_cast<std::size_t>(std::ranges::mismatch(drawn, cells).in1 - drawn.begin());
  if (const Layout all(cells, columns); all.starts.size() > height) {
    const auto last = std::max(all.placeOf(at).row + 1, height);
    const auto first = all.starts[last - height];
    if (last < all.starts.size()) cells.resize(all.starts[last]);
    cells.erase(cells.begin(), cells.begin() + static_cast<std::ptrdiff_t>(first));
    at -= first;
    same = 0;
  }

  const Layout before(drawn, columns);
  const Layout now(cells, columns);
  const Place start = before.placeOf(same);
  std::string output = drawn.empty() ? "\r" : moving(before.placeOf(drawnCursor), start);
  if (drawn.empty() || same < drawn.size()) {
    // tmux takes a row that is cleared from its first column on for a line of its own, and keeps
    // the whole screen as history.
    output += start.column > 0 ? "\033[J" : " \033[J\r";
  }
  for (auto i = same; i < cells.size(); ++i) output += cells[i].glyph;
  output += moving(now.placeOf(cells.size()), now.placeOf(at));
  session.write(output);
  drawn = std::move(cells);
  drawnCursor = at;
}

void LineDisplay::clear() {
  const Layout rows(drawn, sizeOfTerminal().columns);
  session.write(moving(rows.placeOf(drawnCursor), {0, 0}));
  forget();
}

void LineDisplay::forget() {
  drawn.clear();
  drawnCursor = 0;
}

void LineDisplay::append(std::string_view text) {
  const Layout rows(drawn, sizeOfTerminal().columns);
  const Place lastRow = {rows.starts.size() - 1, 0};
  session.write(moving(rows.placeOf(drawnCursor), lastRow) + "\r\n" + std::string(text));
  forget();
}

}  // namespace host
