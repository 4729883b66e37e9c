#include "tool/vell_command_base.h"

#include <utility>

VellCommandBase::VellCommandBase(std::string nodeName, std::weak_ptr<CommandBase> parentNode,
                                 std::shared_ptr<vell::client::Manager> managerClient,
                                 WorkQueue workQueue)
    : CommandBase(std::move(nodeName), std::move(parentNode)),
      manager(std::move(managerClient)),
      queue(std::move(workQueue)) {}
