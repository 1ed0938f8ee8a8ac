#pragma once

#include "platform/lumo.h"

/// Whether the baseband manager server runs, according to its last report; false before the first.
/// Advisory: it orders no other memory access. Any thread.
bool IsServerRunning();

/// Updates that from the payload of a server-state event. Any state other than
/// `zub::kServerStateStarted`, and a malformed payload, means that the server does not run. Called
/// on the tool queue.
void SetServerState(const lumo::object& payload);
