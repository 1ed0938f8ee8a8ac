#pragma once

#include "framework/CommandBase.h"

class LogdumpCommand;

/// Returns the handler that asks the server to collect telephony logs. It sends the request and
/// returns true. When the reply arrives, it prints the outcome and, on success, the path, and
/// leaves its task group.
///
/// `node` is the command that registers the handler, and must outlive it.
CommandHandler TelephonyLogsHandler(const LogdumpCommand& node);

/// The same with a core dump of the modem, which resets the baseband.
CommandHandler TelephonyLogsWithCoredumpHandler(const LogdumpCommand& node);
