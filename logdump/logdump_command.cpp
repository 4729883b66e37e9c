#include "logdump/logdump_command.h"

#include "logdump/handlers.h"
#include "logdump/logdump_args.h"
#include "tool/server_state.h"

#include <iostream>
#include <utility>

const char* const kServerDownErrorPrint = "Server is not running. Please try after server starts.";

const LogContext& GetOsLogContext() {
  static const LogContext context{"org.velltool", "global"};
  return context;
}

std::shared_ptr<CommandBase> LogdumpCommand::create(std::string name,
                                                    std::weak_ptr<CommandBase> parent,
                                                    std::shared_ptr<vell::client::Manager> manager,
                                                    WorkQueue queue) {
  const std::shared_ptr<LogdumpCommand> node(
      new LogdumpCommand(std::move(name), std::move(parent), std::move(manager), std::move(queue)));
  node->init();
  return node;
}

void LogdumpCommand::registerCommands() {
  addCommandHandler("tel", makeTelephonyLogsHandler(*this),
                    "[nocompress|tar.gz|tar] [nonui] <reason> collect telephony logs");
  addCommandHandler(
      "core", makeCoreDumpHandler(*this),
      "[nocompress|tar.gz|tar] [nonui] <reason> collect telephony logs with coredump");
  addCommandHandler("bb", makeBasebandLogsHandler(*this),
                    "[nocompress|tar.gz|tar] <reason> collect baseband logs only");
  addWordCompleter("tel", completeLogdumpArgs(true));
  addWordCompleter("core", completeLogdumpArgs(true));
  addWordCompleter("bb", completeLogdumpArgs(false));
  addCommandHandler("oslog", makeOsLogHandler(),
                    "[history size] [output txt file path] -p <process1 process2..> "
                    "-i <imagePath1 imagePath2..> collect oslog to txt");
  addWordCompleter("oslog", completeOsLogArgs);
}

bool LogdumpCommand::isAllowed(std::string word) {
  if (word == "bb" || IsServerRunning()) {
    return true;
  }
  std::cerr << kServerDownErrorPrint << std::endl;
  return false;
}
