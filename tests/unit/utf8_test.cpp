#include "platform/unicode/utf8.h"

#include <gtest/gtest.h>

TEST(Utf8, ReplacesEachBrokenSequenceOnce) {
  const std::pair<std::string, std::string> cases[] = {
      {std::string("a\0 \xC3\xA4 \xE2\x82\xAC \xF0\x9F\x93\xB1", 14), std::string("a\0 ä € 📱", 14)},
      {"\xEF\xBF\xBD|\xF4\x8F\xBF\xBF", "\xEF\xBF\xBD|\xF4\x8F\xBF\xBF"},
      {"\x80\xBF|\xC3|\xC3(|\xC0\xAF", "\uFFFD\uFFFD|\uFFFD|\uFFFD(|\uFFFD\uFFFD"},
      {"\xE2\x82|\xE0\x80\x80|\xED\xA0\x80", "\uFFFD|\uFFFD\uFFFD\uFFFD|\uFFFD\uFFFD\uFFFD"},
      {"\xF0\x90\x80x|\xF4\x90\x80\x80|\xF8\x88\xFF",
       "\uFFFDx|\uFFFD\uFFFD\uFFFD\uFFFD|\uFFFD\uFFFD\uFFFD"},
      {"\xF0\x8F\xBF\xBF|\xE2\x82\xE2\x82\xAC\xC3", "\uFFFD\uFFFD\uFFFD\uFFFD|\uFFFD€\uFFFD"}};
  for (const auto& [bytes, text] : cases) {
    EXPECT_EQ(validUtf8(bytes), text) << testing::PrintToString(bytes);
  }
}

TEST(Utf8, ReplacesForInterchangeWhatNotEveryProgramTakes) {
  EXPECT_EQ(
      interchangeText(std::string("a\0\xFF|\uFDCF\uFDD0\uFDEF\uFDF0|\uFFFD\uFFFE\uFFFF|", 27) +
                      "\U0001FFFD\U0010FFFF"),
      "a\uFFFD\uFFFD|\uFDCF\uFFFD\uFFFD\uFDF0|\uFFFD\uFFFD\uFFFD|\U0001FFFD\uFFFD");
}
