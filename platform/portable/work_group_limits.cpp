// The two operations of a work group that can fail: for want of memory, and for want of time.

#include "platform/portable/work_group_state.h"

#include <new>

WorkGroup WorkGroup::create() {
  WorkGroup group;
  try {
    group.state = std::make_shared<State>();
  } catch (const std::bad_alloc&) {
    // The handle stays absent, which is how the caller learns of it.
  }
  return group;
}

bool WorkGroup::waitFor(std::chrono::nanoseconds timeout) const {
  std::unique_lock lock(state->mutex);
  return state->emptied.wait_for(lock, timeout, [this] { return state->outstanding == 0; });
}
