#pragma once

#include <list>
#include <string>
#include <vector>

/// Splits input into words and words into command groups.
///
/// A word list holds its words in reverse order: the first word typed is the back of the list, the
/// last word its front. Words are bytes, with no quoting, escapes or encoding.
///
/// The functions have no state and no errors.

/// Removes the next word, the back, from `words`, which must not be empty, and returns it.
std::string TakeNextWord(std::list<std::string>& words);

/// The words of a typed line, which white space of the "C" locale separates.
std::list<std::string> convertLineToList(const std::string& line);

/// Splits `words` into command groups at each word "--". The groups are in typing order; each is a
/// word list, and none is empty.
std::vector<std::list<std::string>> splitCmdList(std::list<std::string> words);

/// The elements of a "cd" path, in typing order. Slashes and white space separate them; a leading
/// slash has no meaning.
std::vector<std::string> splitCmdPath(std::string path);
