#include "simulator/device_model.h"

#include "platform/compression.h"
#include "platform/helper_names.h"
#include "platform/manager_names.h"

#include <algorithm>
#include <cctype>
#include <ctime>
#include <iomanip>
#include <iterator>
#include <sstream>
#include <string_view>
#include <utility>

namespace simulator {

namespace {

constexpr const char* kFaultGetTraceProperty = "GET_TRACE_PROPERTY";
constexpr const char* kFaultTraceDumpState = "TRACE_DUMP_STATE";
constexpr const char* kFaultHelper = "HELPER_ANSWER";

constexpr std::int32_t kStatusBadRequest = static_cast<std::int32_t>(0xE020E003U);

constexpr std::int64_t kAlderVendor = 2;
constexpr std::string_view kTypeEnding = "_TYPE";

bool isFaultKey(const std::string& key) {
  const auto base = key.substr(0, key.find('.'));
  return base == kFaultGetTraceProperty || base == kFaultTraceDumpState || base == kFaultHelper;
}

std::map<std::string, FaultPlan> readFaultPlans(const SettingsFile& profile,
                                                ProfileReader& reader) {
  std::map<std::string, FaultPlan> plans;
  for (const auto& [key, setting] : profile.settings) {
    if (!isFaultKey(key)) {
      continue;
    }
    if (const auto plan = parseFaultPlan(setting.value)) {
      plans[key] = *plan;
    } else {
      reader.reject(key,
                    "made of answer, no-dictionary, wrong-signature, silent, die, restart, "
                    "status:NUMBER and slow:MILLISECONDS");
    }
  }
  return plans;
}

/// The trace properties: what has a point in its key and is not a fault.
std::map<std::string, TypedSetting> readTraces(const SettingsFile& profile, ProfileReader& reader) {
  std::map<std::string, TypedSetting> traces;
  for (const auto& [key, setting] : profile.settings) {
    if (key.find('.') == std::string::npos || isFaultKey(key)) {
      continue;
    }
    const auto name =
        key.ends_with(kTypeEnding) ? key.substr(0, key.size() - kTypeEnding.size()) : key;
    traces[name] = reader.typed(name);
  }
  return traces;
}

/// A timestamp becomes a part of file names.
TypedSetting readTimestamp(const std::string& key, ProfileReader& reader) {
  auto timestamp = reader.typed(key);
  if (timestamp.text && timestamp.text->find('/') != std::string::npos) {
    reader.reject(key, "a part of a file name");
    timestamp.text.reset();
  }
  return timestamp;
}

std::vector<std::string> splitWords(const std::string& text) {
  std::istringstream words(text);
  return {std::istream_iterator<std::string>(words), {}};
}

std::string presentTime() {
  const auto now = std::chrono::system_clock::now();
  const auto milliseconds =
      std::chrono::duration_cast<std::chrono::milliseconds>(now.time_since_epoch()).count() % 1000;
  const auto seconds = std::chrono::system_clock::to_time_t(now);
  std::tm parts{};
  localtime_r(&seconds, &parts);
  std::ostringstream text;
  text << std::put_time(&parts, "%Y-%m-%d-%H-%M-%S-") << std::setw(3) << std::setfill('0')
       << milliseconds;
  return text.str();
}

// The manager's own names for collections and its own words for on. The tool has them too, and the
// tests see whether the two agree.

/// Whether the manager takes the value of a trace property for on.
bool isOn(const TypedSetting& setting) {
  auto text = setting.type == ValueType::String ? setting.text.value_or("") : "";
  std::transform(text.begin(), text.end(), text.begin(), [](unsigned char character) {
    return static_cast<char>(character < 0x80 ? std::tolower(character) : character);
  });
  constexpr std::string_view kOnWords[] = {"true", "on", "yes", "full", "lite"};
  return std::find(std::begin(kOnWords), std::end(kOnWords), text) != std::end(kOnWords) ||
         parseInteger(text).value_or(0) != 0;
}

std::int64_t requestedCompression(const MessageDict& request) {
  for (const auto& entry : request.entries()) {
    const auto* const mode = std::get_if<std::int64_t>(&entry.value);
    if (entry.key == vell::kKeyTraceDumpStatePerformCompression && mode != nullptr) {
      return *mode;
    }
  }
  return kCompressionNone;
}

/// The collection `log-bb-TIMESTAMP...` with a directory for each suffix.
Collection makeCollection(const std::string& timestamp, const std::vector<std::string>& suffixes,
                          std::int64_t compression) {
  const auto name = "log-bb-" + timestamp;
  Collection collection;
  for (const auto& suffix : suffixes) {
    collection.directories.push_back(name + suffix);
  }
  collection.gzip = compression == kCompressionTarGz;
  if (collection.gzip || compression == kCompressionTar) {
    collection.archive = name + (collection.gzip ? ".tar.gz" : ".tar");
  }
  return collection;
}

Answer makeFailure(std::int32_t status, const std::string& message) {
  Answer answer;
  answer.status = status;
  answer.message = message;
  return answer;
}

/// `answer` with what `plan` makes of it. Only what is replied to has been collected.
Answer withFaults(Answer answer, const FaultPlan& plan) {
  if (plan.status != 0) {
    // The reply stays: nobody is to go by the reply of a command that failed.
    answer.status = plan.status;
    answer.message = "failed as the profile says";
    answer.collection.reset();
  }
  if (plan.noDictionary) {
    answer.reply = MessageDict::notADictionary();
  }
  if (plan.conduct != Conduct::Reply) {
    answer.collection.reset();
  }
  answer.delay = plan.delay;
  answer.conduct = plan.conduct;
  return answer;
}

}  // namespace

DeviceModel DeviceModel::fromProfile(const SettingsFile& profile,
                                     std::vector<SettingsFile::Fault>& faults) {
  ProfileReader reader(profile, faults);
  DeviceModel model;
  model.journal = reader.either("JOURNAL", "yes", "no", true);
  model.bus = reader.either("BUS", "yes", "no", true);
  model.manager = reader.either("MANAGER", "running", "absent", true);
  model.helper = reader.either("HELPER", "running", "absent", true);
  model.tracesSaved = reader.either("SAVED_TRACES", "yes", "no", true);
  model.processNames = splitWords(reader.text("PROCESSES").value_or("Linkward modemhostd"));
  model.serverState = reader.typed("SERVER_STATE");
  model.timestamp = readTimestamp("TIMESTAMP", reader);
  model.helperTimestamp = readTimestamp("HELPER_TIMESTAMP", reader);
  model.traces = readTraces(profile, reader);
  model.faultPlans = readFaultPlans(profile, reader);
  // The keys of the device itself: the tool reads them too and it is the one to report them.
  model.alderRadio = parseInteger(reader.text("RADIO_VENDOR").value_or("")) == kAlderVendor;
  model.qdss = reader.text("RADIO_DIAG_QDSS") == "yes";
  return model;
}

std::optional<std::map<std::string, std::string>> DeviceModel::savedTraces() const {
  if (!tracesSaved) {
    return std::nullopt;
  }
  std::map<std::string, std::string> saved;
  for (const auto& [name, setting] : traces) {
    if (setting.type == ValueType::String) {
      saved[name] = setting.text.value_or("");
    }
  }
  return saved;
}

MessageDict DeviceModel::serverStatePayload() const {
  MessageDict payload;
  serverState.putInto(payload, vell::kKeyServerState, vell::kServerStateStarted);
  return payload;
}

Answer DeviceModel::performCommand(const std::string& command, const MessageDict& request) const {
  if (command == vell::kCommandGetTraceProperty) {
    return traceProperty(request);
  }
  if (command == vell::kCommandTraceDumpState) {
    return dumpTraces(request);
  }
  return makeFailure(kStatusBadRequest, "unknown command " + command);
}

Answer DeviceModel::performHelperCommand(const std::string& command) const {
  if (command != vell::helper::kCommandTidewellStatus) {
    return makeFailure(kStatusBadRequest, "unknown command " + command);
  }
  Answer answer;
  helperTimestamp.putInto(answer.reply, vell::helper::kKeyTimestampString, presentTime());
  const auto name = answer.reply.getString(vell::helper::kKeyTimestampString);
  if (!name.empty()) {
    answer.collection = makeCollection(name, {traceSuffix()}, kCompressionNone);
  }
  return withFaults(std::move(answer), faultFor(kFaultHelper, ""));
}

Answer DeviceModel::traceProperty(const MessageDict& request) const {
  const auto name =
      request.getString(vell::kKeyTraceName) + "." + request.getString(vell::kKeyTracePropertyName);
  Answer answer;
  if (const auto found = traces.find(name); found != traces.end()) {
    found->second.putInto(answer.reply, vell::kKeyTracePropertyValue, "");
  }
  return withFaults(std::move(answer), faultFor(kFaultGetTraceProperty, name));
}

Answer DeviceModel::dumpTraces(const MessageDict& request) const {
  const auto action = request.getString(vell::kKeyTraceAction);
  const std::map<std::string, std::vector<std::string>> suffixesByAction = {
      {vell::kCollectTelephonyLogs, {"-telephony", "-state"}},
      {vell::kCollectTelephonyLogsWithCoredump, {alderRadio ? "-coredump" : "-cd", "-telephony"}},
      {vell::kCollectBasebandLogs, {traceSuffix()}},
  };
  const auto suffixes = suffixesByAction.find(action);
  if (suffixes == suffixesByAction.end()) {
    return makeFailure(kStatusBadRequest, "unknown trace action " + action);
  }
  Answer answer;
  timestamp.putInto(answer.reply, vell::kKeyTimestampString, presentTime());
  answer.collection = makeCollection(answer.reply.getString(vell::kKeyTimestampString),
                                     suffixes->second, requestedCompression(request));
  return withFaults(std::move(answer), faultFor(kFaultTraceDumpState, action));
}

FaultPlan DeviceModel::faultFor(const std::string& command, const std::string& detail) const {
  std::string narrowest = command;
  narrowest += "." + detail;
  for (const auto& key : {narrowest, command}) {
    if (const auto found = faultPlans.find(key); found != faultPlans.end()) {
      return found->second;
    }
  }
  return {};
}

std::string DeviceModel::traceSuffix() const {
  if (alderRadio) {
    return "-bb-trace";
  }
  const auto highThroughput =
      traces.find(std::string(vell::kTraceBaseband) + "." + vell::kKeyTraceHighTput);
  const bool qdssTrace = qdss && highThroughput != traces.end() && isOn(highThroughput->second);
  return qdssTrace ? "-qdss" : "-diag";
}

}  // namespace simulator
