#pragma once

#include "platform/lumo.h"

/// Whether the baseband manager server runs, as far as it has told: false until it reports that it
/// has started, and again once it reports any other state. Any thread; it orders nothing else.
bool IsServerRunning();

/// Takes in the payload of a server-state event. What is not exactly the started state, malformed
/// payloads included, counts as not running. Called on the tool queue.
void SetServerState(const lumo::object& payload);
