#include "platform/work_group.h"

#include "platform/portable/work_group_state.h"

#include <utility>

void WorkGroup::enter() const {
  const std::lock_guard lock(state->mutex);
  ++state->outstanding;
}

void WorkGroup::leave() const {
  // Notified under the lock: a waiter that wakes may drop the last handle at once.
  const std::lock_guard lock(state->mutex);
  if (--state->outstanding == 0) {
    state->emptied.notify_all();
  }
}

void WorkGroup::wait() const {
  std::unique_lock lock(state->mutex);
  state->emptied.wait(lock, [this] { return state->outstanding == 0; });
}

WorkGroup::Membership::Membership(WorkGroup joined) : group(std::move(joined)) {
  group.enter();
}

WorkGroup::Membership::Membership(const Membership& other) : group(other.group) {
  if (group) {
    group.enter();
  }
}

WorkGroup::Membership::~Membership() {
  if (group) {
    group.leave();
  }
}
