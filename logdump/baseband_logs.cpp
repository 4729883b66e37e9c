#include "logdump/baseband_logs.h"

#include "logdump/logdump_args.h"
#include "logdump/logdump_command.h"
#include "logdump/system_logs_trace.h"
#include "logdump/trace_flag.h"
#include "logdump/trace_paths.h"
#include "platform/compression.h"
#include "platform/helper_client.h"
#include "platform/helper_names.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "platform/telephony.h"
#include "tool/config.h"

#include <iostream>
#include <list>
#include <string>

namespace {

constexpr const char* kHelperClientName = "logdump.helper";

/// The helper's task that has to do with the system's diagnostic collections.
constexpr vell::helper::TaskID kDiagnosticsTask = 4;

constexpr std::int64_t kHelperTimeoutMilliseconds = 1500;

void printFailure() {
  std::cout << "Baseband log collection: Failed" << std::endl;
}

/// A property of the baseband trace, as the manager tells it.
struct FlagAnswer {
  bool asked = false;     ///< The query itself succeeded.
  bool readable = false;  ///< What came back was a dictionary.
  bool flag = false;      ///< The property's value; off when it is missing or not understood.
};

FlagAnswer askTraceFlag(const LogdumpCommand& node, MessageDict& request, const char* property) {
  request.set(vell::kKeyTracePropertyName, property);
  MessageDict reply;
  const auto result =
      vell::client::PerformCommand(node.manager, vell::kCommandGetTraceProperty, request, &reply);
  FlagAnswer answer{result.status == 0, reply.isDictionary(), false};
  if (answer.asked && answer.readable) {
    parseTraceFlag(reply.getString(vell::kKeyTracePropertyValue, vell::kUnknown), answer.flag);
  }
  return answer;
}

/// How the collection is to be packed: not at all where the device or the trace mode forbids it.
CompressionMode allowedMode(LogdumpCommand& node, CompressionMode wanted) {
  const bool packed = !isSystemLogsTraceModeThree(node) && compressionSupported();
  return packed ? wanted : kCompressionNone;
}

/// The timestamp of the collection that the helper knows of; empty when it does not say.
std::string askHelperForTimestamp() {
  const auto helper = vell::HelperClient::create(kHelperClientName, nullptr);
  MessageDict request;
  request.set(vell::helper::kKeyTimeout, kHelperTimeoutMilliseconds);
  MessageDict reply;
  const auto result =
      helper->perform(kDiagnosticsTask, vell::helper::kCommandTidewellStatus, request, reply);
  return result.status == 0 ? reply.getString(vell::helper::kKeyTimestampString) : "";
}

void printCollected(const MessageDict& reply, CompressionMode mode, bool highThroughput) {
  const auto timestamp = reply.getString(vell::kKeyTimestampString);
  std::cout << "Baseband log collection: Success (Vell running)" << std::endl;
  std::cout << "Path = "
            << buildLogPath(timestamp, mode, vell::trace::getBasebandTraceDirSuffix(highThroughput))
            << std::endl;
}

/// Prints where the traces lie that a manager which does not run has left behind.
void printLeftBehind(bool highThroughput) {
  const auto timestamp =
      config::build::internal_or_carrier() ? askHelperForTimestamp() : std::string();
  std::cout << "Baseband log collection: Success (Vell not running)" << std::endl;
  if (!timestamp.empty()) {
    std::cout << "Path = "
              << buildLogPath(timestamp, kCompressionNone,
                              vell::trace::getBasebandTraceDirSuffix(highThroughput))
              << std::endl;
    return;
  }
  std::cout << "Path = " << vell::trace::kScratchFolder
            << (highThroughput ? diag::config::kQDSSScratchDir : diag::config::kDIAGScratchDir)
            << std::endl;
}

void dumpTrace(LogdumpCommand& node, std::list<std::string> args, bool highThroughput) {
  auto mode = defaultCompressionMode();
  std::string reason;
  bool nonui = false;  // accepted for the sake of the other handlers, and of no effect here
  parseLogdumpArgs(args, mode, reason, nonui);
  mode = allowedMode(node, mode);

  MessageDict request;
  request.set(vell::kKeyTraceDumpStateReason, reason);
  request.set(vell::kKeyTraceAction, vell::kCollectBasebandLogs);
  request.set(vell::kKeyTraceDumpStatePerformCompression, mode);
  MessageDict reply;
  const auto result =
      vell::client::PerformCommand(node.manager, vell::kCommandTraceDumpState, request, &reply);
  switch (result.status) {
    case 0:
      return printCollected(reply, mode, highThroughput);
    case vell::kStatusManagerNotRunning:
      return printLeftBehind(highThroughput);
    default:
      return printFailure();
  }
}

bool collect(LogdumpCommand& node, const std::list<std::string>& args) {
  MessageDict request;
  request.set(vell::kKeyTraceName, vell::kTraceBaseband);
  const auto enabled = askTraceFlag(node, request, vell::kKeyTraceEnabled);
  if (!enabled.asked || !enabled.readable) {
    printFailure();
  } else if (!enabled.flag) {
    std::cout << "Baseband logs are not enabled" << std::endl;
  } else {
    const bool highThroughput =
        radioDiagSupportsQdss() && askTraceFlag(node, request, vell::kKeyTraceHighTput).flag;
    dumpTrace(node, args, highThroughput);
  }
  return enabled.asked;
}

}  // namespace

CommandHandler makeBasebandLogsHandler(LogdumpCommand& node) {
  return [&node](const WorkGroup& /*group*/, const std::list<std::string>& args) {
    return collect(node, args);
  };
}
