#pragma once

#include <string>
#include <string_view>

namespace host {

/// A text to look for inside others, regardless of case and diacritics.
///
/// Folding takes a letter to its small base letter and drops combining marks (U+0300 to U+036F).
/// It covers ASCII and the Latin letters of U+00C0 to U+024F and U+1E00 to U+1EFF, with those that
/// are the other case of one of these. A letter with an accent, a stroke, a hook or a tail has a
/// base letter; a ligature or a digraph, such as U+00C6 or U+01C4, loses only its case and
/// accents. All other text is unchanged. Ill-formed UTF-8 counts as U+FFFD.
///
/// Threads: any, after it has been made.
class FoldedText {
 public:
  explicit FoldedText(std::string_view text);

  /// True when `text`, folded, contains this one. A text that folds to nothing is in every other.
  bool isIn(std::string_view text) const;

 private:
  std::u32string folded;
};

}  // namespace host
