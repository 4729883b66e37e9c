#include "tool/vell_command.h"

#include "logdump/logdump_command.h"

#include <utility>

std::shared_ptr<CommandBase> VellCommand::create(std::string name,
                                                 std::weak_ptr<CommandBase> parent,
                                                 std::shared_ptr<vell::client::Manager> manager,
                                                 WorkQueue queue) {
  const std::shared_ptr<VellCommand> node(
      new VellCommand(std::move(name), std::move(parent), std::move(manager), std::move(queue)));
  node->init();
  return node;
}

void VellCommand::registerCommands() {
  addSubCommand("logdump", LogdumpCommand::create("logdump", shared_from_this(), manager, queue));
}
