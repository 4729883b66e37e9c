#pragma once

#include "platform/system_log.h"
#include "tool/vell_command_base.h"

#include <memory>
#include <string>

/// What a refused command is answered with on standard error.
extern const char* const kServerDownErrorPrint;

/// The tool's log context: made on the first call, exactly once, and the same on every call until
/// the process exits.
const LogContext& GetOsLogContext();

/// The node "logdump": its four handlers collect logs.
class LogdumpCommand : public VellCommandBase {
 public:
  /// The only way the node is made: constructs it, then initialises it. On the shell thread.
  static std::shared_ptr<CommandBase> create(std::string name, std::weak_ptr<CommandBase> parent,
                                             std::shared_ptr<vell::client::Manager> manager,
                                             WorkQueue queue);

  /// Everything while the manager runs; only "bb", which finds its way without it, while it does
  /// not. A refusal is told on standard error.
  bool isAllowed(std::string word) override;

 private:
  using VellCommandBase::VellCommandBase;

  void registerCommands() override;
};
