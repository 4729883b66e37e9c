#pragma once

#include "platform/work_group.h"

#include <condition_variable>
#include <mutex>

/// The counter that the handles of one group share.
struct WorkGroup::State {
  std::mutex mutex;
  std::condition_variable emptied;
  unsigned outstanding = 0;  ///< Guarded by `mutex`.
};
