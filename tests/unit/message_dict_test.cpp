#include "platform/message_dict.h"

#include <gtest/gtest.h>

TEST(MessageDict, KeepsTheOrderInWhichKeysWereFirstSet) {
  MessageDict dict;
  dict.set("b", "text");
  dict.set("a", std::int64_t{1});
  dict.set("c", false);
  dict.set("b", "newer");
  const std::vector<MessageDict::Entry> expected = {
      {"b", "newer"}, {"a", std::int64_t{1}}, {"c", false}};
  EXPECT_EQ(dict.entries(), expected);
}

TEST(MessageDict, ReadsOnlyStringsAsStrings) {
  MessageDict dict;
  dict.set("text", "x");
  dict.set("number", std::int64_t{1});
  dict.set("flag", true);
  dict.set("other", MessageDict::OtherType{});
  EXPECT_EQ(dict.getString("text", "fallback"), "x");
  for (const auto* key : {"number", "flag", "other", "missing", "Text"}) {
    EXPECT_EQ(dict.getString(key), "") << key;
    EXPECT_EQ(dict.getString(key, "fallback"), "fallback") << key;
  }
  EXPECT_FALSE(MessageDict::notADictionary().isDictionary());
  EXPECT_EQ(MessageDict::notADictionary().getString("text"), "");
  EXPECT_NE(MessageDict::notADictionary(), MessageDict());
}
