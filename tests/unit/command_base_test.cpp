#include "framework/command_base.h"

#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

#include <future>
#include <thread>

TEST(CommandBase, FindsWholeWordsOfWhatIsThere) {
  const auto node = PlainNode::create("root", {}, [](PlainNode& self) {
    self.addHandlers({"tel"});
    self.addChild("sub", [](PlainNode&) {});
    self.addCommandHandler("none", nullptr, "help");
    self.addSubCommand("none", nullptr);
  });
  for (const std::string word :
       {"tel", "Tel", "te", "telx", "tel ", "", "sub", "Sub", "su", "subs", "none"}) {
    EXPECT_EQ(node->isValidCommand(word), word == "tel") << word;
    EXPECT_EQ(node->isValidSubCommand(word), word == "sub") << word;
    EXPECT_EQ(node->getSubCommandObj(word) != nullptr, word == "sub") << word;
  }
}

TEST(CommandBase, BuildsHierarchyPathsFromLiveParents) {
  std::string seen;
  const auto look = [&](PlainNode& node) {
    const auto parent = node.getParent().lock();
    seen += node.getHierarchy() + " below " + (parent ? parent->getHierarchy() : "none") + "\n";
  };
  const auto root = PlainNode::create("velltool", {}, [&](PlainNode& self) {
    look(self);
    self.addChild("logdump", look);
  });
  const std::weak_ptr<CommandBase> gone = PlainNode::create("gone", {}, look);
  PlainNode::create("orphan", gone, look);
  EXPECT_EQ(seen,
            "/velltool below none\n/velltool/logdump below /velltool\n/gone below none\n"
            "/orphan below none\n");
  EXPECT_EQ(root->getSubCommandObj("logdump")->getParent().lock(), root);
}

TEST(CommandBase, ReturnsTheResultOfTheLatestHandlerAfterItsWorkIsDone) {
  std::promise<void> handlerReturned;
  std::string log;
  std::thread worker;
  const auto replaced = std::make_shared<int>();
  const auto node = PlainNode::create("root", {}, [&](PlainNode& self) {
    self.addCommandHandler(
        "slow", [replaced](auto&&...) { return false; }, "");
    self.addCommandHandler(
        "slow",
        [&](const WorkGroup& group, const std::list<std::string>& args) {
          worker = std::thread([&, args, membership = WorkGroup::Membership(group)] {
            handlerReturned.get_future().wait();
            log = args.front() + args.back();
          });
          handlerReturned.set_value();
          return true;
        },
        "");
  });
  EXPECT_TRUE(node->execCommand("slow", {"a", "b"}));
  EXPECT_EQ(log, "ab");
  worker.join();
  EXPECT_EQ(replaced.use_count(), 1);
  EXPECT_FALSE(node->execCommand("unknown", {}));
}
