#include "platform/work_group.h"

#include <gtest/gtest.h>

#include <optional>
#include <thread>
#include <utility>

using namespace std::chrono_literals;

TEST(WorkGroup, IsEnteredOnceForEachLiveCopyOfAMembership) {
  EXPECT_FALSE(WorkGroup());
  const auto group = WorkGroup::create();
  EXPECT_TRUE(group.waitFor(0ns));
  std::optional<WorkGroup::Membership> first(group);
  auto second = std::make_optional(*first);
  auto moved = std::make_optional(std::move(*second));
  first.reset();
  second.reset();
  EXPECT_FALSE(group.waitFor(0ns));
  bool done = false;
  std::thread worker([&done, membership = *std::exchange(moved, std::nullopt)] { done = true; });
  group.wait();
  EXPECT_TRUE(done);
  worker.join();
}
