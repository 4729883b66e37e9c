#include "logdump/trace_paths.h"

#include "tests/in_process/device.h"

#include <gtest/gtest.h>

TEST(TracePaths, GoByTheVendorOfTheRadioWhichIsAskedForOnceForCoreDumps) {
  for (const int vendor : {0, 1, 2, 3, -2}) {
    in_process::device.radioVendor = vendor;
    EXPECT_EQ(vell::trace::getCoreDumpDirSuffix(), "-cd");
    EXPECT_EQ(vell::trace::getBasebandTraceDirSuffix(false), vendor == 2 ? "-bb-trace" : "-diag");
    EXPECT_EQ(vell::trace::getBasebandTraceDirSuffix(true), vendor == 2 ? "-bb-trace" : "-qdss");
  }
}
