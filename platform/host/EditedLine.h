#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace host {

/// A line that is being edited: its bytes, and a cursor before one of its characters or at its end.
class EditedLine {
 public:
  /// Where the cursor can go from where it is. Blanks separate words: no other white space gets
  /// into a line.
  enum class Motion { toStart, toEnd, left, right, wordLeft, wordRight };

  const std::string& text() const { return bytes; }
  std::string beforeCursor() const { return bytes.substr(0, cursor); }

  /// Makes `text` the line, with the cursor at `position`, or at its end.
  void set(std::string text, std::size_t position = std::string::npos);

  void insert(std::string_view text);
  void move(Motion motion) { cursor = after(motion); }

  /// Erases from the cursor to where `motion` leads. Returns what it has erased.
  std::string erase(Motion motion);

  /// Swaps the characters on both sides of the cursor, at the end of the line the last two, and
  /// moves past them.
  void transpose();

 private:
  std::size_t after(Motion motion) const;

  std::string bytes;
  std::size_t cursor = 0;
};

}  // namespace host
