#pragma once

#include "framework/CommandBase.h"

/// The handler that exports the recent system log of chosen processes into a text file, on the
/// calling thread. Its words are the history in seconds, the file's path, and the processes and
/// image paths after "-p" and "-i". A failure of the export itself shows in the result and, with
/// its reason, in the system log.
CommandHandler OsLogHandler();
