#include "simulator/answer.h"

#include "platform/compression.h"
#include "platform/helper_names.h"
#include "platform/manager_names.h"

#include <algorithm>
#include <ctime>
#include <iomanip>
#include <map>
#include <sstream>
#include <thread>
#include <utility>

namespace simulator {

namespace {

constexpr std::int32_t kStatusBadRequest = static_cast<std::int32_t>(0xE020E003U);

/// A payload that names a collection by the present time, which no other call has returned.
MessageDict presentTime(const std::string& key) {
  std::this_thread::sleep_for(std::chrono::milliseconds(1));
  const auto now = std::chrono::system_clock::now();
  const auto seconds = std::chrono::system_clock::to_time_t(now);
  std::tm parts{};
  localtime_r(&seconds, &parts);
  std::ostringstream text;
  text << std::put_time(&parts, "%Y-%m-%d-%H-%M-%S-") << std::setw(3) << std::setfill('0')
       << now.time_since_epoch() / std::chrono::milliseconds(1) % 1000;
  return MessageDict::fromEntries({{key, text.str()}});
}

Answer refuse(const std::string& what) {
  return {.status = kStatusBadRequest, .message = "unknown " + what};
}

/// `answer` with what goes wrong by the plan for `detail` of `fault`, or else by that for `fault`.
/// Only what is replied to has been collected.
Answer withFaults(Answer answer, const Profile& profile, const std::string& fault,
                  const std::string& detail = "") {
  auto found = profile.faults.find(fault + "." + detail);
  found = found == profile.faults.end() ? profile.faults.find(fault) : found;
  const auto plan = found == profile.faults.end() ? FaultPlan() : found->second;
  if (plan.status != 0) {
    // The reply stays: nobody is to go by the reply of a command that failed.
    answer.status = plan.status;
    answer.message = "failed as the profile says";
  }
  if (plan.noDictionary) {
    answer.reply = MessageDict::notADictionary();
  }
  if (plan.status != 0 || plan.conduct != Conduct::Reply) {
    answer.collection.reset();
  }
  answer.delay = plan.delay;
  answer.conduct = plan.conduct;
  return answer;
}

// The manager's own names for collections. The tool has them too, and the tests see whether the two
// agree.

constexpr const char* kCollectionPrefix = "log-bb-";

std::string traceSuffix(const Profile& profile) {
  return profile.alderRadio ? "-bb-trace" : profile.qdssTrace ? "-qdss" : "-diag";
}

/// What the collection is packed into; empty when `request` does not ask for that.
std::string archiveName(const std::string& name, const MessageDict& request) {
  const auto asksFor = [&](CompressionMode mode) {
    const MessageDict::Entry entry = {vell::kKeyTraceDumpStatePerformCompression, mode};
    return std::count(request.entries().begin(), request.entries().end(), entry) > 0;
  };
  if (asksFor(kCompressionTarGz)) {
    return name + ".tar.gz";
  }
  return asksFor(kCompressionTar) ? name + ".tar" : "";
}

Answer traceProperty(const Profile& profile, const MessageDict& request) {
  const auto name =
      request.getString(vell::kKeyTraceName) + "." + request.getString(vell::kKeyTracePropertyName);
  Answer answer;
  if (const auto found = profile.traces.find(name); found != profile.traces.end()) {
    answer.reply = found->second;
  }
  return withFaults(std::move(answer), profile, kFaultGetTraceProperty, name);
}

Answer traceDump(const Profile& profile, const MessageDict& request) {
  const auto action = request.getString(vell::kKeyTraceAction);
  const std::map<std::string, std::vector<std::string>> suffixesByAction = {
      {vell::kCollectTelephonyLogs, {"-telephony", "-state"}},
      {vell::kCollectTelephonyLogsWithCoredump,
       {profile.alderRadio ? "-coredump" : "-cd", "-telephony"}},
      {vell::kCollectBasebandLogs, {traceSuffix(profile)}},
  };
  const auto suffixes = suffixesByAction.find(action);
  if (suffixes == suffixesByAction.end()) {
    return refuse("trace action " + action);
  }
  Answer answer;
  answer.reply = profile.timestamp.value_or(presentTime(vell::kKeyTimestampString));
  const auto name = kCollectionPrefix + answer.reply.getString(vell::kKeyTimestampString);
  answer.collection.emplace().archive = archiveName(name, request);
  for (const auto& suffix : suffixes->second) {
    answer.collection->directories.push_back(name + suffix);
  }
  return withFaults(std::move(answer), profile, kFaultTraceDumpState, action);
}

}  // namespace

Answer answerOfManager(const Profile& profile, const std::string& command,
                       const MessageDict& request) {
  if (command == vell::kCommandGetTraceProperty) {
    return traceProperty(profile, request);
  }
  if (command == vell::kCommandTraceDumpState) {
    return traceDump(profile, request);
  }
  return refuse("command " + command);
}

Answer answerOfHelper(const Profile& profile, const std::string& command,
                      const MessageDict& /*request*/) {
  if (command != vell::helper::kCommandTidewellStatus) {
    return refuse("command " + command);
  }
  Answer answer;
  answer.reply = profile.helperTimestamp.value_or(presentTime(vell::helper::kKeyTimestampString));
  const auto name = answer.reply.getString(vell::helper::kKeyTimestampString);
  if (!name.empty()) {
    answer.collection = Collection{{kCollectionPrefix + name + traceSuffix(profile)}, ""};
  }
  return withFaults(std::move(answer), profile, kFaultHelper);
}

}  // namespace simulator
