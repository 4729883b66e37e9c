#include "platform/device/settings_file.h"

#include "platform/device/device_profile.h"

#include <gtest/gtest.h>

#include <tuple>

namespace {

/// Everything a file holds, as one text.
std::string describe(const SettingsFile& file) {
  std::string text;
  for (const auto& [key, setting] : file.settings) {
    text += std::to_string(setting.line) + ":" + key + "=[" + setting.value + "] ";
  }
  for (const auto& fault : file.faults) {
    text += "!" + std::to_string(fault.line) + ":" + fault.what + " ";
  }
  return text;
}

std::string describe(const DeviceProfile& profile) {
  return testing::PrintToString(
      std::tuple(profile.radioType, profile.productCode, profile.radioVendor, profile.radioDiagQdss,
                 profile.internalBuild, profile.carrierBuild, profile.defaultCompression,
                 profile.compressionSupported));
}

}  // namespace

TEST(SettingsFile, ReadsLinesOfKeyAndValue) {
  const std::string badQuotes = "A: value is not quoted as it must be ";
  const std::pair<std::string, std::string> cases[] = {
      {"", ""},
      {"\n  # A=1\n#\n \t\n", ""},
      {"A=1\n  B_2.c=x=y  \r\nA=", "3:A=[] 2:B_2.c=[x=y] "},
      {"A='a \"b\" \\ # c'\nB=\"a 'b' \\\" \\$ \\\\\"",
       "1:A=[a \"b\" \\ # c] 2:B=[a 'b' \" $ \\] "},
      {"A=''\nB=\"\"", "1:A=[] 2:B=[] "},
      {"A=1\nA='x\nB=ok", "3:B=[ok] !2:" + badQuotes},
      {"A=\"x\\\"", "!1:" + badQuotes},
      {"A='x' y", "!1:" + badQuotes},
      {"A=x y", "!1:" + badQuotes},
      {"nonsense\n=x\nA B=1\n\xFF\xFE=1",
       "!1:not a KEY=value line !2:not a KEY=value line !3:not a KEY=value line "
       "!4:not a KEY=value line "},
      {std::string("A=x\0y", 5), std::string("1:A=[x\0y] ", 10)}};
  for (const auto& [text, expected] : cases) {
    EXPECT_EQ(describe(SettingsFile::parse(text)), expected) << text;
  }
}

TEST(DeviceProfile, HasADefaultForWhatIsMissingOrCannotBeRead) {
  auto good = SettingsFile::parse(
      "RADIO_TYPE=-4\nPRODUCT_CODE=58\nRADIO_VENDOR=2\nRADIO_DIAG_QDSS=yes\nINTERNAL_BUILD=yes\n"
      "CARRIER_BUILD=yes\nDEFAULT_COMPRESSION=-9000000000\nCOMPRESSION_SUPPORTED=no\nOTHER=x\n");
  EXPECT_EQ(describe(DeviceProfile::from(good)),
            "(-4, 58, 2, true, true, true, -9000000000, false)");
  EXPECT_TRUE(good.faults.empty());

  auto bad = SettingsFile::parse(
      "RADIO_TYPE=1x\nPRODUCT_CODE=\nRADIO_VENDOR=99999999999\nRADIO_DIAG_QDSS=YES\n"
      "DEFAULT_COMPRESSION=zip\nCOMPRESSION_SUPPORTED=0\n");
  EXPECT_EQ(describe(DeviceProfile::from(bad)), "(0, 0, 0, false, false, false, 0, true)");
  bad.settings.clear();
  EXPECT_EQ(describe(bad),
            "!1:RADIO_TYPE: '1x' is not an integer !2:PRODUCT_CODE: '' is not an integer "
            "!3:RADIO_VENDOR: '99999999999' is not an integer "
            "!4:RADIO_DIAG_QDSS: 'YES' is not yes or no "
            "!5:DEFAULT_COMPRESSION: 'zip' is not nocompress, tar.gz, tar or an integer "
            "!6:COMPRESSION_SUPPORTED: '0' is not yes or no ");
}
