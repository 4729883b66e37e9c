#include "platform/message_dict.h"

#include <gtest/gtest.h>

TEST(MessageDict, KeepsTheOrderOfItsKeysAndReadsOnlyStringsAsStrings) {
  MessageDict dict;
  dict.set("b", "text");
  dict.set("a", std::int64_t{1});
  dict.set("c", false);
  dict.set("b", "newer");
  dict.set("d", MessageDict::OtherType{});
  EXPECT_EQ(
      dict.entries(),
      (std::vector<MessageDict::Entry>{
          {"b", "newer"}, {"a", std::int64_t{1}}, {"c", false}, {"d", MessageDict::OtherType{}}}));
  EXPECT_EQ(dict.getString("b", "fallback"), "newer");
  for (const auto* key : {"a", "c", "d", "missing", "B"}) {
    EXPECT_EQ(dict.getString(key), "") << key;
    EXPECT_EQ(dict.getString(key, "fallback"), "fallback") << key;
  }
  EXPECT_FALSE(MessageDict::notADictionary().isDictionary());
  EXPECT_EQ(MessageDict::notADictionary().getString("b"), "");
}
