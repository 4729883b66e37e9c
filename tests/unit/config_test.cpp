#include "tool/config.h"

#include "tests/in_process/device.h"

#include <gtest/gtest.h>

#include <set>

TEST(Config, KnowsTheWatchClassProducts) {
  const std::set<int> watches = {58, 59, 60, 61, 87, 88, 103, 104, 105, 106};
  for (int code = -1; code <= 120; ++code) {
    in_process::startDevice("PRODUCT_CODE=" + std::to_string(code));
    EXPECT_EQ(config::hw::watch(), watches.contains(code)) << code;
  }
}

TEST(Config, CountsInternalAndCarrierBuildsAlike) {
  in_process::startDevice("");
  EXPECT_FALSE(config::build::internal_or_carrier());
  in_process::startDevice("INTERNAL_BUILD=yes");
  EXPECT_TRUE(config::build::internal_or_carrier());
  in_process::startDevice("CARRIER_BUILD=yes");
  EXPECT_TRUE(config::build::internal_or_carrier());
}
