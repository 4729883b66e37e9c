#include "platform/text.h"

#include "platform/linux/utf8.h"

#include <gtest/gtest.h>

TEST(Utf8, ReplacesEachBrokenSequenceOnce) {
  const std::string r = "\xEF\xBF\xBD";
  const struct {
    std::string bytes;
    std::string text;
  } cases[] = {
      {"", ""},
      {"plain \xC3\xA4 \xE2\x82\xAC \xF0\x9F\x93\xB1",
       "plain \xC3\xA4 \xE2\x82\xAC \xF0\x9F\x93\xB1"},
      {std::string("a\0b", 3), std::string("a\0b", 3)},
      {"\xEF\xBF\xBF|\xF4\x8F\xBF\xBF", "\xEF\xBF\xBF|\xF4\x8F\xBF\xBF"},
      {"\x80\xBF", r + r},
      {"\xC3", r},
      {"\xC3(", r + "("},
      {"\xC0\xAF", r + r},
      {"\xE2\x82|", r + "|"},
      {"\xE0\x80\x80", r + r + r},
      {"\xED\xA0\x80", r + r + r},
      {"\xF0\x9F\x93x", r + "x"},
      {"\xF4\x90\x80\x80", r + r + r + r},
      {"\xF8\x88\xFF", r + r + r},
      {"\xE2\x82\xE2\x82\xAC", r + "\xE2\x82\xAC"},
  };
  for (const auto& [bytes, text] : cases) {
    EXPECT_EQ(validUtf8(bytes), text) << testing::PrintToString(bytes);
  }
}

TEST(Text, IgnoresTheCaseOfAsciiLettersAlone) {
  EXPECT_TRUE(equalNoCase("Tar.GZ", "tAR.gz"));
  EXPECT_TRUE(equalNoCase("", ""));
  EXPECT_FALSE(equalNoCase("tar", "tar.gz"));
  EXPECT_FALSE(equalNoCase("[", "{"));
  EXPECT_FALSE(equalNoCase("\xC3\x84", "\xC3\xA4"));
}
