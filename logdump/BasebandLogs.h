#pragma once

#include "framework/CommandBase.h"

class LogdumpCommand;

/// Returns the handler that asks the server to dump the baseband trace logs or, if no server runs,
/// asks the helper service where they are. Its requests are synchronous; it does not use its task
/// group. It returns false only if the query whether the trace is enabled fails; other failures are
/// printed.
///
/// `node` is the command that registers the handler, and must outlive it.
CommandHandler BasebandLogsHandler(const LogdumpCommand& node);
