#pragma once

#include "framework/CommandBase.h"

/// The handler that exports the recent system log of chosen processes into a text file, on the
/// calling thread. Its words are the history in seconds, the file's path, and the processes and
/// image paths behind "-p" and "-i". What fails in the export itself shows in the system log and in
/// the result alone.
CommandHandler OsLogHandler();
