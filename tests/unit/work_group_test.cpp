#include "platform/work_group.h"

#include <gtest/gtest.h>

#include <optional>
#include <thread>
#include <utility>

TEST(WorkGroup, IsEnteredOnceForEachLiveCopyOfAMembership) {
  const auto group = WorkGroup::create();
  std::optional<WorkGroup::Membership> first(group);
  auto second = std::make_optional(*first);
  auto moved = std::make_optional(std::move(*second));
  first.reset();
  second.reset();
  EXPECT_FALSE(group.waitFor({}));
  bool done = false;
  std::thread worker([&done, membership = *std::exchange(moved, std::nullopt)] { done = true; });
  group.wait();
  EXPECT_TRUE(done);
  worker.join();
}
