#pragma once

#include <list>
#include <string>
#include <vector>

/// Turns raw input into words and words into command groups.
///
/// A word list holds its words in reverse order: the first word typed is the list's back, the last
/// its front. Producers insert each new word at the front; consumers take the next word from the
/// back. Words are bytes: nothing is decoded, unquoted or unescaped.
///
/// Pure functions: no state, no errors.

/// Takes the next word in typing order off `words`, which must not be empty.
std::string TakeNextWord(std::list<std::string>& words);

/// The words of a typed line: its runs of characters that are not white space in the "C" locale.
std::list<std::string> convertLineToList(const std::string& line);

/// Cuts `words` into command groups at each word that is exactly "--". The groups come in typing
/// order; each is a word list again, and none is empty.
std::vector<std::list<std::string>> splitCmdList(std::list<std::string> words);

/// The elements of a "cd" path, which slashes and white space separate, in typing order. A leading
/// slash means nothing.
std::vector<std::string> splitCmdPath(std::string path);
