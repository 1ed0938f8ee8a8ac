#include "platform/host/EditedLine.h"

#include <algorithm>

#include "platform/host/ScreenText.h"

namespace host {

void EditedLine::set(std::string text, std::size_t position) {
  bytes = std::move(text);
  cursor = std::min(position, bytes.size());
}

void EditedLine::insert(std::string_view text) {
  bytes.insert(cursor, text);
  cursor += text.size();
}

std::string EditedLine::erase(Motion motion) {
  const auto [first, last] = std::minmax({cursor, after(motion)});
  auto erased = bytes.substr(first, last - first);
  bytes.erase(first, last - first);
  cursor = first;
  return erased;
}

void EditedLine::transpose() {
  if (cursor == 0) return;
  if (cursor == bytes.size()) move(Motion::left);
  const auto right = erase(Motion::right);
  move(Motion::left);
  insert(right);
  move(Motion::right);
}

std::size_t EditedLine::after(Motion motion) const {
  const auto before = std::string_view(bytes).substr(0, cursor);
  const auto rest = std::string_view(bytes).substr(cursor);
  switch (motion) {
    using enum Motion;
    case toStart:
      return 0;
    case toEnd:
      return bytes.size();
    case left:
      return cursor - (before.empty() ? 0 : cellsOf(before).back().bytes);
    case right:
      return cursor + (rest.empty() ? 0 : cellsOf(rest).front().bytes);
    case wordLeft:
      return before.substr(0, before.find_last_not_of(' ') + 1).rfind(' ') + 1;
    case wordRight:
      return std::min(bytes.find(' ', bytes.find_first_not_of(' ', cursor)), bytes.size());
  }
  return cursor;
}

}  // namespace host
