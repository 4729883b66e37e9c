#include "logdump/handlers.h"
#include "logdump/logdump_args.h"
#include "logdump/logdump_command.h"
#include "logdump/trace_paths.h"
#include "logdump/trace_value.h"
#include "platform/compression.h"
#include "platform/helper_client.h"
#include "platform/helper_names.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "platform/telephony.h"
#include "tool/config.h"

#include <cstdint>
#include <iostream>
#include <list>
#include <string>

namespace {

constexpr const char* kHelperClientName = "logdump.helper";

/// The helper's task for the system's diagnostic collections.
constexpr vell::helper::TaskID kDiagnosticsTask = 4;

constexpr std::int64_t kHelperTimeoutMilliseconds = 1500;

void printFailure() {
  std::cout << "Baseband log collection: Failed" << std::endl;
}

/// The manager's answer to a query for a property of the baseband trace.
struct FlagAnswer {
  bool answered = false;  ///< The query succeeded.
  bool readable = false;  ///< The reply is a dictionary.
  bool flag = false;      ///< The property's value; off when it is missing or not understood.
};

FlagAnswer askTraceFlag(const LogdumpCommand& node, MessageDict& request, const char* property) {
  request.set(vell::kKeyTracePropertyName, property);
  MessageDict reply;
  const auto result =
      vell::client::PerformCommand(node.manager, vell::kCommandGetTraceProperty, request, &reply);
  // A command that failed leaves no dictionary, and so the flag off.
  FlagAnswer answer{result.status == 0, reply.isDictionary(), false};
  parseTraceFlag(reply.getString(vell::kKeyTracePropertyValue, vell::kUnknown), answer.flag);
  return answer;
}

/// `wanted`, or no compression where the device or the trace mode forbids it.
CompressionMode allowedMode(LogdumpCommand& node, CompressionMode wanted) {
  const bool packed = !isSystemLogsTraceModeThree(node) && compressionSupported();
  return packed ? wanted : kCompressionNone;
}

/// The timestamp of the helper's collection; empty when the helper does not say.
std::string askHelperForTimestamp() {
  const auto helper = vell::HelperClient::create(kHelperClientName, nullptr);
  MessageDict request;
  request.set(vell::helper::kKeyTimeout, kHelperTimeoutMilliseconds);
  MessageDict reply;
  // The result need not be examined: a command that failed leaves no dictionary.
  helper->perform(kDiagnosticsTask, vell::helper::kCommandTidewellStatus, request, reply);
  return reply.getString(vell::helper::kKeyTimestampString);
}

void printSuccess(const char* managerState, const std::string& path) {
  std::cout << "Baseband log collection: Success (Vell " << managerState << ")" << std::endl;
  std::cout << "Path = " << path << std::endl;
}

/// Where a manager that no longer runs left its traces.
std::string leftBehindPath(bool highThroughput) {
  const auto timestamp =
      config::build::internal_or_carrier() ? askHelperForTimestamp() : std::string();
  if (!timestamp.empty()) {
    return buildLogPath(timestamp, kCompressionNone,
                        vell::trace::getBasebandTraceDirSuffix(highThroughput));
  }
  const std::string folder = vell::trace::kScratchFolder;
  return folder + (highThroughput ? diag::config::kQDSSScratchDir : diag::config::kDIAGScratchDir);
}

void dumpTrace(LogdumpCommand& node, const std::list<std::string>& args, bool highThroughput) {
  // "nonui" is accepted and has no effect here.
  const auto options = readLogdumpOptions(args);
  const auto mode = allowedMode(node, options.mode);
  MessageDict request;
  request.set(vell::kKeyTraceDumpStateReason, options.reason);
  request.set(vell::kKeyTraceAction, vell::kCollectBasebandLogs);
  request.set(vell::kKeyTraceDumpStatePerformCompression, mode);
  MessageDict reply;
  const auto result =
      vell::client::PerformCommand(node.manager, vell::kCommandTraceDumpState, request, &reply);
  switch (result.status) {
    case 0:
      return printSuccess("running",
                          buildLogPath(reply.getString(vell::kKeyTimestampString), mode,
                                       vell::trace::getBasebandTraceDirSuffix(highThroughput)));
    case vell::kStatusManagerNotRunning:
      return printSuccess("not running", leftBehindPath(highThroughput));
    default:
      return printFailure();
  }
}

bool collect(LogdumpCommand& node, const std::list<std::string>& args) {
  MessageDict request;
  request.set(vell::kKeyTraceName, vell::kTraceBaseband);
  const auto enabled = askTraceFlag(node, request, vell::kKeyTraceEnabled);
  if (!enabled.readable) {
    printFailure();
  } else if (!enabled.flag) {
    std::cout << "Baseband logs are not enabled" << std::endl;
  } else {
    const bool highThroughput =
        radioDiagSupportsQdss() && askTraceFlag(node, request, vell::kKeyTraceHighTput).flag;
    dumpTrace(node, args, highThroughput);
  }
  return enabled.answered;
}

}  // namespace

CommandHandler makeBasebandLogsHandler(LogdumpCommand& node) {
  return [&node](const WorkGroup& /*group*/, const std::list<std::string>& args) {
    return collect(node, args);
  };
}
