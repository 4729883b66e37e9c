// The two operations of a work group that can fail, as the log device has it.

#include "platform/linux/work_group_state.h"
#include "tests/in_process/log_device.h"

WorkGroup WorkGroup::create() {
  WorkGroup group;
  if (in_process::logDevice().groupsCanBeMade) {
    group.state = std::make_shared<State>();
  }
  return group;
}

bool WorkGroup::waitFor(std::chrono::nanoseconds timeout) const {
  in_process::logDevice().longestWait = timeout;
  std::unique_lock lock(state->mutex);
  const auto isEmpty = [this] { return state->outstanding == 0; };
  if (in_process::logDevice().timeRunsOut) {
    return isEmpty();
  }
  return state->emptied.wait_for(lock, timeout, isEmpty);
}
