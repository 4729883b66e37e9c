#include "platform/text.h"

#include "platform/linux/utf8.h"

#include <gtest/gtest.h>

TEST(Utf8, ReplacesEachBrokenSequenceOnce) {
  // With ? in place of each replacement.
  const std::pair<std::string, std::string> cases[] = {
      {"", ""},
      {"plain \xC3\xA4 \xE2\x82\xAC \xF0\x9F\x93\xB1", "plain ä € 📱"},
      {std::string("a\0b", 3), std::string("a\0b", 3)},
      {"\xEF\xBF\xBD|\xF4\x8F\xBF\xBF", "\xEF\xBF\xBD|\xF4\x8F\xBF\xBF"},
      {"\x80\xBF|\xC3|\xC3(|\xC0\xAF", "??|?|?(|??"},
      {"\xE2\x82|\xE0\x80\x80|\xED\xA0\x80", "?|???|???"},
      {"\xF0\x9F\x93x|\xF4\x90\x80\x80|\xF8\x88\xFF", "?x|????|???"},
      {"\xE2\x82\xE2\x82\xAC\xC3", "?€?"}};
  for (const auto& [bytes, text] : cases) {
    auto expected = text;
    for (auto at = expected.find('?'); at != std::string::npos; at = expected.find('?', at)) {
      expected.replace(at, 1, "\xEF\xBF\xBD");
    }
    EXPECT_EQ(validUtf8(bytes), expected) << testing::PrintToString(bytes);
  }
}

TEST(Text, IgnoresTheCaseOfAsciiLettersAlone) {
  EXPECT_TRUE(equalNoCase("Tar.GZ", "tAR.gz"));
  EXPECT_FALSE(equalNoCase("tar", "tar.gz"));
  EXPECT_FALSE(equalNoCase("[", "{"));
  EXPECT_FALSE(equalNoCase("\xC3\x84", "\xC3\xA4"));
}
