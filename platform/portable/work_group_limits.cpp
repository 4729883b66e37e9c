// The two operations of a work group that may fail. In a file of their own because the unit tests
// leave it out and have them fail at will.

#include "platform/portable/work_group_state.h"

WorkGroup WorkGroup::create() {
  WorkGroup group;
  group.state = std::make_shared<State>();
  return group;
}

bool WorkGroup::waitFor(std::chrono::nanoseconds timeout) const {
  std::unique_lock lock(state->mutex);
  return state->emptied.wait_for(lock, timeout, [this] { return state->outstanding == 0; });
}
