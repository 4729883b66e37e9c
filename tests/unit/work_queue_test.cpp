#include "platform/work_queue.h"

#include <gtest/gtest.h>

#include <future>
#include <string>

TEST(WorkQueue, RunsEverythingInOrderBeforeItsLastHandleGoes) {
  std::string log;
  {
    std::promise<void> gate;
    const auto queue = WorkQueue::create("test");
    queue.submit([&] { gate.get_future().wait(); });
    for (const char letter : {'a', 'b', 'c'}) {
      queue.submit([&log, letter] { log += letter; });
    }
    gate.set_value();
  }
  EXPECT_EQ(log, "abc");
}

TEST(WorkQueue, MayLoseItsLastHandleOnItsOwnThread) {
  std::promise<void> done;
  auto queue = std::make_shared<WorkQueue>(WorkQueue::create("test"));
  const auto& handle = *queue;
  handle.submit([held = std::move(queue), &done] { held->submit([&done] { done.set_value(); }); });
  done.get_future().wait();
}
