#pragma once

#include "tool/vell_command_base.h"

#include <memory>
#include <string>

/// The root of the tool's tree. It has the one child "logdump" and no handlers.
class VellCommand : public VellCommandBase {
 public:
  /// The only way a root is made: constructs it, then initialises it, which builds the whole tree.
  /// On the shell thread.
  static std::shared_ptr<CommandBase> create(std::string name, std::weak_ptr<CommandBase> parent,
                                             std::shared_ptr<vell::client::Manager> manager,
                                             WorkQueue queue);

 private:
  using VellCommandBase::VellCommandBase;

  void registerCommands() override;
};
