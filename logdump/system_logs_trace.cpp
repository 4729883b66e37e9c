#include "logdump/system_logs_trace.h"

#include "logdump/logdump_command.h"
#include "logdump/trace_value.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"

namespace {

constexpr int kModeThree = 3;

}  // namespace

bool isSystemLogsTraceModeThree(LogdumpCommand& node) {
  MessageDict request;
  request.set(vell::kKeyTraceName, vell::kTraceSystemLogs);
  request.set(vell::kKeyTracePropertyName, vell::kKeyTraceMode);
  MessageDict reply;
  // The result need not be examined: a command that failed leaves no dictionary.
  vell::client::PerformCommand(node.manager, vell::kCommandGetTraceProperty, request, &reply);
  return parseTraceMode(reply.getString(vell::kKeyTracePropertyValue)) == kModeThree;
}
