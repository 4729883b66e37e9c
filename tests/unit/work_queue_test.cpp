#include "platform/work_queue.h"

#include <gtest/gtest.h>
#include <pthread.h>

#include <future>
#include <optional>
#include <string>

TEST(WorkQueue, RunsEverythingInOrderBeforeItsLastHandleGoes) {
  std::string log;
  {
    std::promise<void> gate;
    auto queue = std::make_optional(WorkQueue::create("test"));
    queue->submit([&] { gate.get_future().wait(); });
    for (const char letter : {'a', 'b', 'c'}) {
      queue->submit([&log, letter] { log += letter; });
    }
    gate.set_value();
    const auto last = *queue;
    queue.reset();
    last.submit([&log] { log += 'd'; });
  }
  EXPECT_EQ(log, "abcd");
}

TEST(WorkQueue, MayLoseItsLastHandleOnItsOwnThread) {
  std::promise<void> done;
  auto queue = std::make_shared<WorkQueue>(WorkQueue::create("test"));
  const auto& handle = *queue;
  handle.submit([held = std::move(queue), &done] { held->submit([&done] { done.set_value(); }); });
  done.get_future().wait();
}

TEST(WorkQueue, IsAbsentWhenNoThreadCanBeStarted) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "A sanitizer gives threads stacks of its own choice.";
#endif
  pthread_attr_t usual{};
  pthread_getattr_default_np(&usual);
  pthread_attr_t boundless = usual;
  ASSERT_EQ(pthread_attr_setstacksize(&boundless, std::size_t{1} << 47U), 0);
  pthread_setattr_default_np(&boundless);
  EXPECT_FALSE(WorkQueue::create("test"));
  pthread_setattr_default_np(&usual);
}
