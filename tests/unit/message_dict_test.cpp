#include "platform/message_dict.h"

#include <gtest/gtest.h>

TEST(MessageDict, HoldsTheLatestValueWhereItsKeyWasFirstSet) {
  using Entries = std::vector<MessageDict::Entry>;
  const auto dict = MessageDict::fromEntries(
      {{"b", "text"}, {"a", "old"}, {"b", "newer"}, {"c", true}, {"a", std::int64_t{1}}});
  EXPECT_EQ(dict.entries(), (Entries{{"b", "newer"}, {"a", std::int64_t{1}}, {"c", true}}));
  for (const auto& [key, text] : {std::pair("b", "newer"), {"B", "fallback"}, {"c", "fallback"}}) {
    EXPECT_EQ(dict.getString(key, "fallback"), text);
  }
}
