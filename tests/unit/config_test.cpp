#include "tool/config.h"

#include "tests/in_process/device.h"

#include <gtest/gtest.h>

#include <set>

TEST(Config, KnowsTheWatchClassProducts) {
  const std::set<int> watches = {58, 59, 60, 61, 87, 88, 103, 104, 105, 106};
  for (int& code = in_process::device.productCode = -1; code <= 120; ++code) {
    EXPECT_EQ(config::hw::watch(), watches.contains(code)) << code;
  }
}
