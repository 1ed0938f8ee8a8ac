#pragma once

#include <memory>
#include <string>
#include <vector>

#include "framework/CommandBase.h"

/// What may stand in place of the last word of `typed`, a line up to its cursor that is typed where
/// the prompt stands at `node`: each result starts with that word, which is empty where `typed`
/// ends in white space. Sorted, each once.
///
/// It offers what the shell would look up there: sub-commands, handlers and the shell's own words,
/// paths after "cd", and "--". After a handler it goes by the handler's help text: a bracket of one
/// word, "[tar|zip]", holds option words; one of several words, "[output file path]", stands for a
/// word of its own before all options, and where it ends in "file path" file names are offered;
/// "-p" in front of the description is an option too. A word that ends in "/" may go on.
///
/// It asks no node for permission and runs nothing; of the system it reads folders alone. Threads:
/// the shell thread.
std::vector<std::string> CompleteLine(const std::shared_ptr<CommandBase>& node,
                                      const std::string& typed);
