#pragma once

#include "framework/command_base.h"
#include "platform/manager_client.h"
#include "platform/work_queue.h"

#include <memory>
#include <string>

/// The base of the tool's own nodes: each carries the one manager client and the one work queue of
/// the tool, and hands both to the children it creates.
class VellCommandBase : public CommandBase {
 public:
  ~VellCommandBase() override = default;

  const std::shared_ptr<vell::client::Manager> manager;
  const WorkQueue queue;

 protected:
  /// A node that is not initialised yet.
  VellCommandBase(std::string nodeName, std::weak_ptr<CommandBase> parentNode,
                  std::shared_ptr<vell::client::Manager> managerClient, WorkQueue workQueue);
};
