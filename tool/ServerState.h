#pragma once

#include "platform/lumo.h"

/// Whether the baseband manager server runs, by its last report: false until it reports that it has
/// started, and again once it reports any other state. Advisory: it orders no other memory access.
bool IsServerRunning();

/// Sets that flag from the payload of a server-state event. Any state but exactly the started one,
/// a malformed payload included, counts as not running. Called on the tool queue.
void SetServerState(const lumo::object& payload);
