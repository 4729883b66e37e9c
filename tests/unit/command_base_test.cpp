#include "framework/command_base.h"

#include "tests/in_process/log_device.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

TEST(CommandBase, FindsWholeWordsOnlyAndRunsNoHandlerWithoutAGroup) {
  const auto node = PlainNode::create("root", {}, [](PlainNode& self) {
    self.addCommandHandler(
        "tel", [](auto&&...) { return false; }, "");
    self.addHandlers({"tel"});
    self.addChild("sub", [](PlainNode&) {});
    self.addCommandHandler("none", nullptr, "help");
    self.addSubCommand("none", nullptr);
  });
  for (const std::string word :
       {"tel", "Tel", "te", "telx", "", "sub", "Sub", "su", "subs", "none"}) {
    EXPECT_EQ(node->isValidCommand(word), word == "tel") << word;
    EXPECT_EQ(node->execCommand(word, {}), word == "tel") << word;
    EXPECT_EQ(node->isValidSubCommand(word), word == "sub") << word;
    EXPECT_EQ(node->getSubCommandObj(word) != nullptr, word == "sub") << word;
  }
  in_process::logDevice.groupsCanBeMade = false;
  EXPECT_FALSE(node->execCommand("tel", {}));
  in_process::logDevice.groupsCanBeMade = true;
}
