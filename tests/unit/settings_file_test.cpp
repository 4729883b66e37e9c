#include "platform/linux/settings_file.h"

#include "platform/linux/device_profile.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <fstream>

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

constexpr const char* kBadQuotes = ": value is not quoted as it must be ";

}  // namespace

TEST(SettingsFile, ReadsLinesOfKeyAndValue) {
  const struct {
    std::string text;
    std::string expected;
  } cases[] = {
      {"", ""},
      {"\n  # A=1\n#\n \t\n", ""},
      {"A=1\n  B_2.c=x=y  \r\nA=", "3:A=[] 2:B_2.c=[x=y] "},
      {"A='a \"b\" \\ # c'\nB=\"a 'b' \\\" \\$ \\\\\"",
       "1:A=[a \"b\" \\ # c] 2:B=[a 'b' \" $ \\] "},
      {"A=''\nB=\"\"", "1:A=[] 2:B=[] "},
      {"A='x\nB=ok", "2:B=[ok] !1:A" + std::string(kBadQuotes)},
      {"A=\"x\\\"", "!1:A" + std::string(kBadQuotes)},
      {"A='x' y", "!1:A" + std::string(kBadQuotes)},
      {"A=x y", "!1:A" + std::string(kBadQuotes)},
      {"nonsense\n=x\nA B=1\n\xFF\xFE=1",
       "!1:not a KEY=value line !2:not a KEY=value line !3:not a KEY=value line "
       "!4:not a KEY=value line "},
      {std::string("A=x\0y", 5), "1:A=[" + std::string("x\0y", 3) + "] "},
  };
  for (const auto& [text, expected] : cases) {
    EXPECT_EQ(describe(SettingsFile::parse(text)), expected) << text;
  }
}

TEST(SettingsFile, TellsAMissingFileFromAnUnreadableOne) {
  const auto folder = testing::TempDir() + "settings" + std::to_string(getpid());
  ASSERT_EQ(mkdir(folder.c_str(), 0700), 0);
  EXPECT_FALSE(SettingsFile::read(folder + "/missing").has_value());
  const auto unreadable = SettingsFile::read(folder);
  ASSERT_TRUE(unreadable.has_value());
  EXPECT_EQ(describe(*unreadable), "!0:not a file ");
  std::ofstream(folder + "/there") << "A=1";
  EXPECT_EQ(describe(*SettingsFile::read(folder + "/there")), "1:A=[1] ");
  std::filesystem::remove_all(folder);
}

TEST(DeviceProfile, HasADefaultForWhatIsMissingOrCannotBeRead) {
  auto good = SettingsFile::parse(
      "RADIO_TYPE=-4\nPRODUCT_CODE=58\nRADIO_VENDOR=2\nRADIO_DIAG_QDSS=yes\nINTERNAL_BUILD=yes\n"
      "CARRIER_BUILD=yes\nDEFAULT_COMPRESSION=-9000000000\nCOMPRESSION_SUPPORTED=no\nOTHER=x\n");
  const auto profile = DeviceProfile::from(good);
  EXPECT_TRUE(good.faults.empty());
  EXPECT_EQ(profile.radioType, -4);
  EXPECT_EQ(profile.productCode, 58);
  EXPECT_EQ(profile.radioVendor, 2);
  EXPECT_TRUE(profile.radioDiagQdss && profile.internalBuild && profile.carrierBuild);
  EXPECT_EQ(profile.defaultCompression, -9000000000);
  EXPECT_FALSE(profile.compressionSupported);

  auto bad = SettingsFile::parse(
      "RADIO_TYPE=1x\nPRODUCT_CODE=\nRADIO_VENDOR=99999999999\nRADIO_DIAG_QDSS=YES\n"
      "DEFAULT_COMPRESSION=zip\nCOMPRESSION_SUPPORTED=0\n");
  const auto defaults = DeviceProfile::from(bad);
  EXPECT_EQ(defaults.radioType, 0);
  EXPECT_EQ(defaults.productCode, 0);
  EXPECT_EQ(defaults.radioVendor, 0);
  EXPECT_FALSE(defaults.radioDiagQdss || defaults.internalBuild || defaults.carrierBuild);
  EXPECT_EQ(defaults.defaultCompression, kCompressionNone);
  EXPECT_TRUE(defaults.compressionSupported);
  bad.settings.clear();
  EXPECT_EQ(describe(bad),
            "!1:RADIO_TYPE: '1x' is not an integer !2:PRODUCT_CODE: '' is not an integer "
            "!3:RADIO_VENDOR: '99999999999' is not an integer "
            "!4:RADIO_DIAG_QDSS: 'YES' is not yes or no "
            "!5:DEFAULT_COMPRESSION: 'zip' is not nocompress, tar.gz, tar or an integer "
            "!6:COMPRESSION_SUPPORTED: '0' is not yes or no ");
}
