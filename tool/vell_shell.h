#pragma once

#include "framework/command_shell.h"

#include <memory>

/// The tool's shell: it connects to the manager and builds the tool's tree.
class VellShell : public CommandShell {
 private:
  /// Opens the manager client, follows its server state, gives the first state event 500 ms to
  /// arrive, and builds the root, named after the program. Never empty.
  std::shared_ptr<CommandBase> createRootCommand() override;
};
