#pragma once

#include "framework/CommandBase.h"

class LogdumpCommand;

/// The handlers that have the server collect telephony logs. Each sends one request, returns true
/// at once and prints the outcome, and the path on success, when the answer comes; its task group
/// is open until then.
///
/// `node` is the command that registers the handler and thereby owns it, so it outlives it.
CommandHandler TelephonyLogsHandler(const LogdumpCommand& node);

/// The same with a core dump of the modem, which resets the baseband.
CommandHandler TelephonyLogsWithCoredumpHandler(const LogdumpCommand& node);
