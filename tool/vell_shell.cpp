#include "tool/vell_shell.h"

#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "platform/program.h"
#include "platform/work_group.h"
#include "platform/work_queue.h"
#include "tool/server_state.h"
#include "tool/vell_command.h"

#include <chrono>
#include <string>
#include <utility>

namespace {

constexpr const char* kQueueLabel = "velltool.queue";
constexpr const char* kClientName = "velltool";
constexpr std::chrono::milliseconds kFirstEventWait(500);

/// Subscribes to the manager's server state. The subscription holds a membership of `group`, which
/// the library keeps for as long as it keeps the handler.
void subscribeToServerState(const std::shared_ptr<vell::client::Manager>& manager,
                            const WorkGroup& group) {
  auto handler = [manager, membership = WorkGroup::Membership(group)](
                     const MessageDict& payload, const WorkGroup& /*eventGroup*/) {
    followServerState(payload);
  };
  vell::client::RegisterEventHandler(manager, vell::kEventServerStateChange, std::move(handler));
  vell::client::EventsOff(manager);
  vell::client::EventsOn(manager);
}

}  // namespace

std::shared_ptr<CommandBase> VellShell::createRootCommand() {
  const auto queue = WorkQueue::create(kQueueLabel);
  const auto manager = vell::client::CreateManager(kClientName, queue);
  const auto group = WorkGroup::create();
  {
    const WorkGroup::Membership ownMembership(group);
    subscribeToServerState(manager, group);
  }
  // Whether the group emptied tells nothing: the handler stays registered, so this lasts in full.
  static_cast<void>(group.waitFor(kFirstEventWait));
  return VellCommand::create(getprogname(), {}, manager, queue);
}
