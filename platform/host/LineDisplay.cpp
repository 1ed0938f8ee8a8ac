#include "platform/host/LineDisplay.h"

#include <algorithm>
#include <string>

namespace host {
namespace {

struct Place {
  std::size_t row;
  std::size_t column;
};

/// Where each of `cells` stands in rows of `columns`, and at last what comes after them. Where they
/// fill a row, that is at its end.
std::vector<Place> placesOf(const std::vector<Cell>& cells, std::size_t columns) {
  std::vector<Place> places;
  Place next = {0, 0};
  for (const auto& cell : cells) {
    if (next.column > 0 && next.column + cell.columns > columns) next = {next.row + 1, 0};
    places.push_back(next);
    next.column += cell.columns;
  }
  places.push_back(next);
  return places;
}

/// The first of `places` that is in `row`.
std::ptrdiff_t startOf(std::size_t row, const std::vector<Place>& places) {
  return std::ranges::lower_bound(places, row, {}, &Place::row) - places.begin();
}

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
  // The cursor after a full row stands on a cell of its own.
  if (placesOf(cells, columns).back().column >= columns) cells.push_back({" ", 1, 0});
  if (const auto all = placesOf(cells, columns); all.back().row >= height) {
    const auto end = std::max(all[at].row + 1, height);
    const auto first = startOf(end - height, all);
    if (end <= all.back().row) cells.erase(cells.begin() + startOf(end, all), cells.end());
    cells.erase(cells.begin(), cells.begin() + first);
    at -= static_cast<std::size_t>(first);
  }

  const auto before = placesOf(drawn, columns);
  const auto now = placesOf(cells, columns);
  const auto changed = std::ranges::mismatch(drawn, cells, {}, &Cell::glyph, &Cell::glyph).in1;
  const auto same = static_cast<std::size_t>(changed - drawn.begin());
  const Place start = std::ranges::min(before[same], now[same], {}, &Place::row);
  std::string output = drawn.empty() ? "\r" : moving(before[drawnCursor], start);
  if (drawn.empty() || same < drawn.size()) {
    // tmux takes a row that is cleared from its first column on for a line of its own, and keeps
    // the whole screen as history.
    output += start.column > 0 ? "\033[J" : " \033[J\r";
  }
  for (auto i = same; i < cells.size(); ++i) output += cells[i].glyph;
  output += moving(now.back(), now[at]);
  session.write(output);
  drawn = std::move(cells);
  drawnCursor = at;
}

void LineDisplay::clear() {
  const auto places = placesOf(drawn, sizeOfTerminal().columns);
  session.write(moving(places[drawnCursor], {0, 0}));
  forget();
}

void LineDisplay::forget() {
  drawn.clear();
  drawnCursor = 0;
}

void LineDisplay::append(std::string_view text) {
  const auto places = placesOf(drawn, sizeOfTerminal().columns);
  const Place lastRow = {places.back().row, 0};
  session.write(moving(places[drawnCursor], lastRow) + "\r\n" + std::string(text));
  forget();
}

}  // namespace host
