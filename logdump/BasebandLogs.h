#pragma once

#include "framework/CommandBase.h"

class LogdumpCommand;

/// The handler that has the server dump the baseband trace logs, or, when no server runs, asks the
/// helper service where they are. All its requests are synchronous; it does not use its task group.
/// It returns false only when the query whether the baseband trace is enabled fails; every other
/// failure shows in the printed lines.
///
/// `node` is the command that registers the handler and thereby owns it, so it outlives it.
CommandHandler BasebandLogsHandler(const LogdumpCommand& node);
