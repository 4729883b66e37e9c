#include "tool/server_state.h"

#include "platform/manager_names.h"

#include <atomic>

namespace {

// Relaxed throughout: nothing else is published through it.
std::atomic<bool> serverRunning = false;

}  // namespace

bool IsServerRunning() {
  return serverRunning.load(std::memory_order_relaxed);
}

void followServerState(const MessageDict& payload) {
  const auto state = payload.getString(vell::kKeyServerState);
  serverRunning.store(state == vell::kServerStateStarted, std::memory_order_relaxed);
}
