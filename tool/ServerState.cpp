#include "tool/ServerState.h"

#include <atomic>

#include "platform/zub_client.h"

namespace {

std::atomic<bool> gServerRunning = false;

}  // namespace

bool IsServerRunning() { return gServerRunning.load(std::memory_order_relaxed); }

void SetServerState(const lumo::object& payload) {
  const auto* const state = payload.get(zub::kKeyServerState).as<std::string>();
  gServerRunning.store(state && *state == zub::kServerStateStarted, std::memory_order_relaxed);
}
