#include "logdump/trace_paths.h"

#include "tests/in_process/device.h"

#include <gtest/gtest.h>

TEST(TracePaths, AskForTheVendorOfTheRadioOnceForCoreDumps) {
  for (int& vendor = in_process::device.radioVendor = 0; vendor <= 2; ++vendor) {
    EXPECT_EQ(vell::trace::getCoreDumpDirSuffix(), "-cd");
  }
}
