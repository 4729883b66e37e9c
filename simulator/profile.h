#pragma once

#include "platform/message_dict.h"

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace simulator {

/// What the asked side does in the end with one request.
enum class Conduct {
  Reply,           ///< Sends the answer.
  WrongSignature,  ///< Replies, but with other arguments than the interface has.
  Silent,          ///< Never replies, and goes on.
  Die,             ///< Its process ends before the reply, for good.
  Restart,         ///< Its process ends before the reply, and a new one takes its place.
};

/// How a request is to go wrong. A default-made plan is that nothing does.
struct FaultPlan {
  Conduct conduct = Conduct::Reply;
  bool noDictionary = false;           ///< The reply is something else than a dictionary.
  std::int32_t status = 0;             ///< Put in place of success; the reply stays.
  std::chrono::milliseconds delay{0};  ///< How long the request is held before all of the above.
};

inline constexpr const char* kFaultGetTraceProperty = "GET_TRACE_PROPERTY";
inline constexpr const char* kFaultTraceDumpState = "TRACE_DUMP_STATE";
inline constexpr const char* kFaultHelper = "HELPER_ANSWER";

/// What a profile says of a device: what runs on it, and what its manager and its helper say. The
/// keys are those of the device profile and the ones that `profiles/default.conf` explains. Each
/// dictionary is sent as it is; it has one value, or none, or is no dictionary.
struct Profile {
  std::string text;  ///< The profile as it was written.
  bool journal = true;
  bool bus = true;
  bool manager = true;
  bool helper = true;
  std::vector<std::string> processes;  ///< The names in the process table.
  bool alderRadio = false;
  bool qdssTrace = false;  ///< Whether baseband traces are taken with high throughput.
  MessageDict serverState;
  std::map<std::string, MessageDict> traces;  ///< By TRACE.PROPERTY.
  bool savedTraces = true;                    ///< Whether they are in the saved settings, too.
  std::optional<MessageDict> timestamp;       ///< Empty: the time of the request.
  std::optional<MessageDict> helperTimestamp;
  std::map<std::string, FaultPlan> faults;  ///< By `kFault...`, or by `kFault...` and .DETAIL.
};

/// The text that `dict`, one of a profile's, holds; null when it holds none. Points into `dict`.
const std::string* textIn(const MessageDict& dict);

/// Reads the profile in the file at `path`, the default device's when `path` is empty. Complains of
/// each thing that cannot be read; empty when that is the file or a value that the simulator goes
/// by. A line that is no setting at all does not stop it: the tool has to live with such lines too.
std::optional<Profile> readProfile(const std::string& path);

}  // namespace simulator
