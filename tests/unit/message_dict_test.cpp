#include "platform/message_dict.h"

#include <gtest/gtest.h>

TEST(MessageDict, KeepsTheOrderOfItsKeysAndReadsOnlyStringsAsStrings) {
  const std::vector<MessageDict::Entry> given = {{"b", "text"},
                                                 {"a", "old"},
                                                 {"b", "newer"},
                                                 {"c", true},
                                                 {"c", false},
                                                 {"a", std::int64_t{1}},
                                                 {"d", MessageDict::OtherType{}}};
  MessageDict dict;
  for (const auto& [key, value] : given) {
    dict.set(key, value);
  }
  EXPECT_EQ(MessageDict::fromEntries(given), dict);
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
