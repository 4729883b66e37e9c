#include "platform/work_group.h"

#include <gtest/gtest.h>

#include <optional>
#include <thread>

using namespace std::chrono_literals;

TEST(WorkGroup, IsEnteredOnceForEachLiveCopyOfAMembership) {
  const auto group = WorkGroup::create();
  EXPECT_TRUE(group.waitFor(0ns));
  std::optional<WorkGroup::Membership> first(group);
  auto second = std::make_optional(*first);
  auto moved = std::make_optional(std::move(*second));
  first.reset();
  second.reset();
  EXPECT_FALSE(group.waitFor(0ns));
  moved.reset();
  EXPECT_TRUE(group.waitFor(0ns));
}

TEST(WorkGroup, ReleasesItsWaiterWhenTheLastMembershipGoes) {
  const auto group = WorkGroup::create();
  bool done = false;
  std::thread worker([&done, membership = WorkGroup::Membership(group)] { done = true; });
  group.wait();
  EXPECT_TRUE(done);
  worker.join();
}

TEST(WorkGroup, MayBeAbsent) {
  const WorkGroup absent;
  EXPECT_FALSE(absent);
  EXPECT_TRUE(WorkGroup::create());
}
