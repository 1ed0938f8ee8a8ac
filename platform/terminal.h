#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>

namespace platform {

/// What may stand in place of the last word of `typed`, a line up to its cursor. That word is empty
/// where `typed` ends in white space; each candidate starts with it, but perhaps for the case of
/// ASCII letters. One that ends in "/" may go on; after any other comes a blank. Each comes with a
/// note to show beside it in a list, which may be empty.
using LineCompleter = std::function<std::map<std::string, std::string>(const std::string& typed)>;

/// Shows `prompt` on the terminal and has a person edit a line there, with keys to move about, a
/// history of the lines before, and `complete` for Tab. Stores the line in `line`, without its line
/// end, each byte as it was typed. A paste gives a line for each key that ends one, and has a blank
/// for all other white space.
///
/// True for a line; an empty one when Ctrl-C has given it up. False when the input has ended.
/// Nothing, with nothing shown or read, when there is no terminal to edit on: standard input or
/// standard output is none, TERM is not set or "dumb", or the port has no line editing. That answer
/// stays the same while the program runs.
///
/// The terminal's settings are other than before while this waits for keys, and at no other time:
/// they are back before it returns, and however the process ends or stops meanwhile, save by a
/// signal that no program can handle, or by a fault of its own. Signals do what they do without it.
/// What standard output was given before must have been flushed. Throws `std::bad_alloc`. Threads:
/// one, any, and the others block the signals that end or stop the process; `complete` runs on it.
std::optional<bool> readEditedLine(const std::string& prompt, const LineCompleter& complete,
                                   std::string& line);

/// Shows on the terminal that work is under way, from one second after this call on: a line that
/// says for how long, and how many lines an export has written, brought up to date each second. It
/// is gone when the result is released, or anything is to be written to std::cout or std::cerr (see
/// openStandardStreams) or to a file that is a terminal, or a signal ends or stops the process;
/// none comes after that output.
///
/// Empty, with nothing shown, where standard output or standard error is no terminal that can move
/// its cursor, and where the system has too little for it. Nothing is shown in the background, nor
/// once a line has been typed for what comes after. Threads: the one that takes the process's
/// signals calls it and releases the result, one at a time; until then another thread takes them.
std::shared_ptr<void> showWork();

}  // namespace platform
