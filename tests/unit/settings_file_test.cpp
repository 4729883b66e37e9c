#include "platform/device/settings_file.h"

#include <gtest/gtest.h>

using namespace std::string_literals;

TEST(SettingsFile, GivesTheLastValueOfEachKeyAndEachLineThatIsFaulty) {
  const auto file = SettingsFile::parse(
      "A=1\n  B_2.c=x=y  \r\nA=\n \t# C=1\n\n"
      "D='a \\\"b\" \\ # c'\n"
      "E=\"a 'b' \\\" \\$ \\` \\\\ \\x\"\n"
      "F=\"\"\nG=1\nG='x\nH=\"x\\\"\nI='x' y\nJ=x y\n"
      "nonsense\n=x\nA B=1\n\xFF\xFE=1\nZ=x\0y"s);
  std::string text;
  for (const auto& [key, setting] : file.settings) {
    text += std::to_string(setting.line) + " " + key + "=[" + setting.value + "]\n";
  }
  for (const auto& fault : file.faults) {
    text += std::to_string(fault.line) + " " + fault.what + "\n";
  }
  const auto badQuotes = ": value is not quoted as it must be\n"s;
  EXPECT_EQ(text,
            "3 A=[]\n2 B_2.c=[x=y]\n6 D=[a \\\"b\" \\ # c]\n7 E=[a 'b' \" $ ` \\ \\x]\n8 F=[]\n"
            "18 Z=[x\0y]\n"s +
                "10 G" + badQuotes + "11 H" + badQuotes + "12 I" + badQuotes + "13 J" + badQuotes +
                "14 not a KEY=value line\n15 not a KEY=value line\n"
                "16 not a KEY=value line\n17 not a KEY=value line\n");
}
