#include "platform/device/settings_file.h"

#include "platform/device/device_profile.h"

#include <gtest/gtest.h>

namespace {

using namespace std::string_literals;

/// Everything a file holds, as one text.
std::string describe(const SettingsFile& file) {
  std::string text;
  for (const auto& [key, setting] : file.settings) {
    text += std::to_string(setting.line) + " " + key + "=[" + setting.value + "]\n";
  }
  for (const auto& fault : file.faults) {
    text += std::to_string(fault.line) + " " + fault.what + "\n";
  }
  return text;
}

}  // namespace

TEST(SettingsFile, GivesTheLastValueOfEachKeyAndEachLineThatIsFaulty) {
  const auto badQuotes = ": value is not quoted as it must be\n"s;
  EXPECT_EQ(describe(SettingsFile::parse("A=1\n  B_2.c=x=y  \r\nA=\n \t# C=1\n\n"
                                         "D='a \\\"b\" \\ # c'\n"
                                         "E=\"a 'b' \\\" \\$ \\` \\\\ \\x\"\n"
                                         "F=\"\"\nG=1\nG='x\nH=\"x\\\"\nI='x' y\nJ=x y\n"
                                         "nonsense\n=x\nA B=1\n\xFF\xFE=1\nZ=x\0y"s)),
            "3 A=[]\n2 B_2.c=[x=y]\n6 D=[a \\\"b\" \\ # c]\n7 E=[a 'b' \" $ ` \\ \\x]\n8 F=[]\n"
            "18 Z=[x\0y]\n"s +
                "10 G" + badQuotes + "11 H" + badQuotes + "12 I" + badQuotes + "13 J" + badQuotes +
                "14 not a KEY=value line\n15 not a KEY=value line\n"
                "16 not a KEY=value line\n17 not a KEY=value line\n");
}

TEST(DeviceProfile, TellsWhichValuesCannotBeRead) {
  auto file = SettingsFile::parse(
      "RADIO_TYPE=1x\nPRODUCT_CODE=\nRADIO_VENDOR=99999999999\nRADIO_DIAG_QDSS=YES\n"
      "DEFAULT_COMPRESSION=zip\nCOMPRESSION_SUPPORTED=0\n");
  EXPECT_TRUE(DeviceProfile::from(file).compressionSupported);
  file.settings.clear();
  EXPECT_EQ(describe(file),
            "1 RADIO_TYPE: '1x' is not an integer\n2 PRODUCT_CODE: '' is not an integer\n"
            "3 RADIO_VENDOR: '99999999999' is not an integer\n"
            "4 RADIO_DIAG_QDSS: 'YES' is not yes or no\n"
            "5 DEFAULT_COMPRESSION: 'zip' is not nocompress, tar.gz, tar or an integer\n"
            "6 COMPRESSION_SUPPORTED: '0' is not yes or no\n");
}
