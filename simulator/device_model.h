#pragma once

#include "platform/device/settings_file.h"
#include "platform/message_dict.h"
#include "simulator/fault_plan.h"
#include "simulator/profile_reader.h"

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace simulator {

/// The logs that a request asks to have collected, as names in the device's snapshot folder.
struct Collection {
  std::vector<std::string> directories;
  std::string archive;  ///< What they are packed into in their place; empty: they lie open.
  bool gzip = false;    ///< Whether the archive is compressed.
};

/// All that the other side does about one request, in the order of the members.
struct Answer {
  std::chrono::milliseconds delay{0};
  std::optional<Collection> collection;  ///< Complete on disk before the reply is sent.
  Conduct conduct = Conduct::Reply;      ///< What follows counts for `Conduct::Reply` only.
  std::int32_t status = 0;
  std::string message;
  MessageDict reply;  ///< May be `notADictionary`, may hold values of other types.
};

/// Where collections are made, and where the live traces are, relative to the device's root.
inline constexpr const char* kSnapshotDirectory =
    "private/var/wireless/Library/Logs/Faultkeeper/Baseband";
inline constexpr const char* kScratchDirectories[] = {
    "private/var/wireless/Library/Logs/VellManager/DIAG.scratch",
    "private/var/wireless/Library/Logs/VellManager/QDSS.scratch",
};

/// The device that a profile describes: what runs on it, and what its manager and its helper
/// answer. Does nothing by itself and has no bus in it.
///
/// The keys of a profile are those of the device profile and the ones that
/// `profiles/default.conf` explains. Answers do not depend on earlier requests. Constant operations
/// may be called from any number of threads; one at a time with `setServerState`.
class DeviceModel {
 public:
  /// The device that `profile` describes. Values that cannot be read are put into `faults`, each
  /// with its key and line, and have their default in the model.
  static DeviceModel fromProfile(const SettingsFile& profile,
                                 std::vector<SettingsFile::Fault>& faults);

  [[nodiscard]] bool journalRuns() const { return journal; }
  [[nodiscard]] bool busRuns() const { return bus; }
  [[nodiscard]] bool managerRuns() const { return manager; }
  [[nodiscard]] bool helperRuns() const { return helper; }

  /// The names in the process table.
  [[nodiscard]] const std::vector<std::string>& processes() const { return processNames; }

  /// What the saved trace settings hold, by trace name, point, property; empty: there is no file.
  [[nodiscard]] std::optional<std::map<std::string, std::string>> savedTraces() const;

  /// The manager's state from now on.
  void setServerState(std::string state) { serverState.text = std::move(state); }

  /// The payload of an event of the manager's for its present state.
  [[nodiscard]] MessageDict serverStatePayload() const;

  /// The manager's answer to a command.
  [[nodiscard]] Answer performCommand(const std::string& command, const MessageDict& request) const;

  /// The helper's answer to a command.
  [[nodiscard]] Answer performHelperCommand(const std::string& command) const;

 private:
  [[nodiscard]] FaultPlan faultFor(const std::string& command, const std::string& detail) const;
  [[nodiscard]] Answer traceProperty(const MessageDict& request) const;
  [[nodiscard]] Answer dumpTraces(const MessageDict& request) const;
  [[nodiscard]] std::string traceSuffix() const;

  bool journal = true;
  bool bus = true;
  bool manager = true;
  bool helper = true;
  bool tracesSaved = true;
  bool alderRadio = false;
  bool qdss = false;
  std::vector<std::string> processNames;
  TypedSetting serverState;
  TypedSetting timestamp;
  TypedSetting helperTimestamp;
  std::map<std::string, TypedSetting> traces;
  std::map<std::string, FaultPlan> faultPlans;
};

}  // namespace simulator
