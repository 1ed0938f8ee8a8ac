#pragma once

#include <cstddef>
#include <string_view>
#include <vector>

#include "platform/host/ScreenText.h"
#include "platform/host/TerminalSession.h"

namespace host {

/// A prompt and the line after it on the screen, in as many rows as they take; of more than the
/// screen has, those down to the cursor's, or the first ones.
///
/// It takes a terminal that understands the control functions of ECMA-48 for moving up, down and
/// right and for clearing what follows, and that goes on in the next row where one is full: all
/// that are in use. What is drawn, it draws from the first change on.
class LineDisplay {
 public:
  explicit LineDisplay(TerminalSession& session) : session(session) {}

  /// Shows `text`, the prompt included, with the cursor before the byte at `cursor`.
  void draw(std::string_view text, std::size_t cursor);

  /// Clears what is drawn, after the terminal has got another size: one that breaks its rows anew
  /// has moved it.
  void clear();

  /// Leaves what is drawn where it is; the next is drawn in the cursor's own row.
  void forget();

  /// Shows `text` in rows of its own after what is drawn, and leaves that where it is.
  void append(std::string_view text);

 private:
  TerminalSession& session;
  std::vector<Cell> drawn;
  std::size_t drawnCursor = 0;  // the cell before which the cursor stands
};

}  // namespace host
