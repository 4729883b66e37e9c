#include "logdump/trace_paths.h"

#include "tests/in_process/device.h"

#include <gtest/gtest.h>

TEST(TracePaths, EndInAnExtensionOrInTheSuffix) {
  const std::string start = "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-";
  EXPECT_EQ(buildLogPath("T", kCompressionNone, "-*"), start + "T-*");
  EXPECT_EQ(buildLogPath("T", kCompressionTarGz, "-*"), start + "T.tar.gz");
  EXPECT_EQ(buildLogPath("T", kCompressionTar, "-*"), start + "T.tar");
  EXPECT_EQ(buildLogPath("", 7, "-x"), start + "-x");
  EXPECT_EQ(buildLogPath("T", -1, ""), start + "T");
}

TEST(TracePaths, HaveTheSuffixOfTheRadiosFamily) {
  for (const int vendor : {0, 1, 2, 3, -2}) {
    in_process::startDevice("RADIO_VENDOR=" + std::to_string(vendor));
    EXPECT_EQ(vell::trace::getBasebandTraceDirSuffix(false), vendor == 2 ? "-bb-trace" : "-diag");
    EXPECT_EQ(vell::trace::getBasebandTraceDirSuffix(true), vendor == 2 ? "-bb-trace" : "-qdss");
  }
}
