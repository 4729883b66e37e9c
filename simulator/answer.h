#pragma once

#include "platform/message_dict.h"
#include "simulator/profile.h"

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simulator {

/// The logs that a request asks to have collected, as names in the device's snapshot folder.
struct Collection {
  std::vector<std::string> directories;
  std::string archive;  ///< What they are packed into in their place; empty: they lie open.
};

/// All that the other side does about one request, in the order of the members.
struct Answer {
  std::chrono::milliseconds delay{0};
  std::optional<Collection> collection =
      std::nullopt;                  ///< Complete on disk before the reply is sent.
  Conduct conduct = Conduct::Reply;  ///< What follows counts for `Conduct::Reply` only.
  std::int32_t status = 0;
  std::string message;
  MessageDict reply = MessageDict();  ///< May be `notADictionary`, may hold values of other types.
};

/// What the manager of the device that `profile` describes answers to a command. Does not depend on
/// earlier requests, but for the time.
Answer answerOfManager(const Profile& profile, const std::string& command,
                       const MessageDict& request);

/// As `answerOfManager`, of its helper.
Answer answerOfHelper(const Profile& profile, const std::string& command,
                      const MessageDict& request);

}  // namespace simulator
