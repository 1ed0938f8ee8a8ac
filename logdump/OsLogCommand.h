#pragma once

#include "framework/CommandBase.h"

/// Returns the handler that exports the recent system log of selected processes to a text file. Its
/// words are the history in seconds, the path of the file, processes after "-p" and image paths
/// after "-i". It returns when the export has ended; the reason of a failure is in the system log.
CommandHandler OsLogHandler();
