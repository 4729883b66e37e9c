#include "logdump/handlers.h"
#include "logdump/logdump_args.h"
#include "logdump/logdump_command.h"
#include "logdump/trace_paths.h"
#include "logdump/trace_value.h"
#include "platform/compression.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"

#include <iostream>
#include <list>
#include <string>
#include <utility>

namespace {

/// Stands for every directory of a collection of telephony logs.
std::string everyDirectorySuffix() {
  return "-*";
}

/// How a kind of collection prints its outcome.
struct Report {
  const char* title;
  std::string (*directorySuffix)();
};

constexpr Report kTelephonyReport = {"Telephony log collection: ", everyDirectorySuffix};
constexpr Report kCoreDumpReport = {"Telephony log collection with Coredump: ",
                                    vell::trace::getCoreDumpDirSuffix};

void printOutcome(const Report& report, CompressionMode mode, const CommandResult& result,
                  const MessageDict& reply) {
  std::cout << report.title << (result.status == 0 ? "Success" : "Failed") << std::endl;
  if (result.status != 0 || !reply.isDictionary()) {
    return;
  }
  const auto timestamp = reply.getString(vell::kKeyTimestampString);
  std::cout << "Path = " << buildLogPath(timestamp, mode, report.directorySuffix()) << std::endl;
}

/// Appends the keys that every collection's request ends with.
void setPackingAndConsent(MessageDict& request, const LogdumpOptions& options) {
  request.set(vell::kKeyTraceDumpStatePerformCompression, options.mode);
  if (options.nonui) {
    request.set(vell::kKeyTraceUserConfirmation, false);
  }
}

/// Sends the request. Its completion keeps `group` entered until the outcome is printed.
void requestCollection(const LogdumpCommand& node, const WorkGroup& group, const Report& report,
                       CompressionMode mode, MessageDict request) {
  auto completion = [report, mode, membership = WorkGroup::Membership(group)](
                        const CommandResult& result, const MessageDict& reply) {
    printOutcome(report, mode, result, reply);
  };
  vell::client::PerformCommand(node.manager, vell::kCommandTraceDumpState, std::move(completion),
                               std::move(request));
}

}  // namespace

CommandHandler makeTelephonyLogsHandler(LogdumpCommand& node) {
  return [&node](const WorkGroup& group, const std::list<std::string>& args) {
    auto options = readLogdumpOptions(args);
    if (isSystemLogsTraceModeThree(node)) {
      options.mode = kCompressionNone;
    }
    MessageDict request;
    request.set(vell::kKeyTraceAction, vell::kCollectTelephonyLogs);
    request.set(vell::kKeyTraceDumpStateReason, options.reason);
    setPackingAndConsent(request, options);
    requestCollection(node, group, kTelephonyReport, options.mode, std::move(request));
    return true;
  };
}

CommandHandler makeCoreDumpHandler(LogdumpCommand& node) {
  return [&node](const WorkGroup& group, const std::list<std::string>& args) {
    const auto options = readLogdumpOptions(args);
    MessageDict request;
    request.set(vell::kKeyBasebandResetType, vell::kBasebandResetTypeHard);
    request.set(vell::kKeyBasebandResetSubType, vell::kBasebandResetSubTypeOtherErrors);
    request.set(vell::kKeyTraceAction, vell::kCollectTelephonyLogsWithCoredump);
    request.set(vell::kKeyBasebandResetReason, options.reason);
    setPackingAndConsent(request, options);
    requestCollection(node, group, kCoreDumpReport, options.mode, std::move(request));
    return true;
  };
}
