#pragma once

#include "platform/command_result.h"
#include "platform/message_dict.h"

#include <cstdint>
#include <memory>

class BusConnection;

namespace vell {

/// A log server for the helper's client to write through. The tool hands in none.
class LogServer;

namespace helper {

/// The number by which the helper tells its tasks apart.
using TaskID = std::uint32_t;

}  // namespace helper

/// A client of the manager's helper daemon. Used on one thread at a time.
class HelperClient {
 public:
  /// A client known to people as `name`; `logServer` may be empty. Never gives an empty pointer: a
  /// helper that is not there shows in the results.
  static std::shared_ptr<HelperClient> create(const char* name,
                                              std::shared_ptr<LogServer> logServer);

  HelperClient(const HelperClient&) = delete;
  HelperClient& operator=(const HelperClient&) = delete;
  ~HelperClient();

  /// Runs one command of the helper and blocks until it is answered, for no longer than the
  /// request's `vell::helper::kKeyTimeout` in milliseconds; without that there is no limit. Status
  /// 0 is success; after any other, and when the helper answered with no dictionary, `reply` is
  /// `MessageDict::notADictionary()`.
  CommandResult perform(helper::TaskID task, const char* command, MessageDict request,
                        MessageDict& reply);

 private:
  explicit HelperClient(std::unique_ptr<BusConnection> opened);

  std::unique_ptr<BusConnection> connection;
};

}  // namespace vell
