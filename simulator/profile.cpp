#include "simulator/profile.h"

#include "platform/device/device_profile.h"
#include "platform/helper_names.h"
#include "platform/manager_names.h"
#include "platform/text.h"
#include "simulator/complaint.h"
#include "simulator/default_profile.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <limits>
#include <sstream>
#include <string_view>
#include <utility>

namespace simulator {

namespace {

constexpr int kAlderVendor = 2;

constexpr const char* kFaultWords =
    "made of answer, no-dictionary, wrong-signature, silent, die, restart, status:NUMBER and "
    "slow:MILLISECONDS";

/// Complains and returns false when the file at `path` cannot be read.
bool readText(const std::string& path, std::string& text) {
  const std::ifstream stream(path, std::ios::binary);
  std::ostringstream content;
  errno = stream ? 0 : errno;
  // A folder opens like a file and fails only when it is read.
  content << stream.rdbuf();
  text = content.str();
  const bool read = errno == 0;
  if (!read) {
    complain(path + ": " + std::strerror(errno));
  }
  return read;
}

bool isFault(const std::string& key) {
  const auto base = key.substr(0, key.find('.'));
  return base == kFaultGetTraceProperty || base == kFaultTraceDumpState || base == kFaultHelper;
}

/// The key whose type `key` tells, if it tells one, else `key`.
std::string withoutType(const std::string& key) {
  constexpr std::string_view kTypeEnding = "_TYPE";
  return key.ends_with(kTypeEnding) ? key.substr(0, key.size() - kTypeEnding.size()) : key;
}

/// The whole of `text` as an integer as C writes it; the nearest one when there is none so large.
std::optional<long long> parseInteger(const std::string& text) {
  char* end = nullptr;
  const auto number = std::strtoll(text.c_str(), &end, 0);
  return text.empty() || *end != '\0' ? std::nullopt : std::optional(number);
}

/// The number after `prefix` in `word`, where there is one between `lowest` and `highest`.
std::optional<long long> numberAfter(std::string_view prefix, const std::string& word,
                                     long long lowest, long long highest) {
  const auto number =
      word.starts_with(prefix) ? parseInteger(word.substr(prefix.size())) : std::nullopt;
  return number && *number >= lowest && *number <= highest ? number : std::nullopt;
}

std::vector<std::string> splitWords(const std::string& text) {
  std::istringstream words(text);
  return {std::istream_iterator<std::string>(words), {}};
}

/// Adds to `plan` what one word says; false when it is none of `kFaultWords`.
bool applyWord(const std::string& word, FaultPlan& plan) {
  static const std::map<std::string_view, Conduct> kConducts = {
      {"answer", Conduct::Reply},    {"wrong-signature", Conduct::WrongSignature},
      {"silent", Conduct::Silent},   {"die", Conduct::Die},
      {"restart", Conduct::Restart},
  };
  constexpr std::chrono::milliseconds kLongestDelay = std::chrono::hours(24);
  if (const auto conduct = kConducts.find(word); conduct != kConducts.end()) {
    plan.conduct = conduct->second;
    return true;
  }
  if (const auto status = numberAfter("status:", word, std::numeric_limits<std::int32_t>::min(),
                                      std::numeric_limits<std::uint32_t>::max())) {
    plan.status = static_cast<std::int32_t>(*status);
    return true;
  }
  if (const auto delay = numberAfter("slow:", word, 0, kLongestDelay.count())) {
    plan.delay = std::chrono::milliseconds(*delay);
    return true;
  }
  if (word != "no-dictionary") {
    return false;
  }
  plan.noDictionary = true;
  return true;
}

bool readFaultPlan(const std::string& text, FaultPlan& plan) {
  const auto words = splitWords(text);
  return std::all_of(words.begin(), words.end(),
                     [&](const auto& word) { return applyWord(word, plan); });
}

/// Whether the manager takes the value of a trace property for on. The tool has the same words of
/// its own, and the tests see whether the two agree.
bool isOn(const MessageDict& value) {
  constexpr const char* kOnWords[] = {"true", "on", "yes", "full", "lite"};
  const auto* const text = textIn(value);
  return text != nullptr &&
         (std::any_of(std::begin(kOnWords), std::end(kOnWords),
                      [&](const char* word) { return equalNoCase(*text, word); }) ||
          parseInteger(*text).value_or(0) != 0);
}

/// The settings of one profile, by what is asked of them. Complains of what cannot be read.
class ProfileReader {
 public:
  ProfileReader(SettingsFile profileSettings, std::string profilePath)
      : file(std::move(profileSettings)), path(std::move(profilePath)) {}

  /// Whether all that was asked for could be read.
  [[nodiscard]] bool succeeded() const { return !failed; }

  /// What the tool reads of the profile. It is the one to complain there.
  DeviceProfile deviceProfile() { return DeviceProfile::from(file); }

  /// Complains of lines that are no settings, and of keys that nobody reads, most likely because
  /// they are misspelt.
  void warn() const {
    for (const auto& fault : file.faults) {
      complainOf(fault.line, fault.what);
    }
    // The default profile has all keys there are, some of them behind a #.
    std::string explained = kDefaultProfile;
    std::erase(explained, '#');
    const auto known = SettingsFile::parse(explained).settings;
    for (const auto& [key, setting] : file.settings) {
      if (key.find('.') == std::string::npos && !known.contains(key) &&
          !known.contains(withoutType(key))) {
        complainOf(setting.line, key + ": not a key of the simulator's; it changes nothing");
      }
    }
  }

  [[nodiscard]] std::string text(const std::string& key, const std::string& fallback) const {
    const auto found = file.settings.find(key);
    return found == file.settings.end() ? fallback : found->second.value;
  }

  /// Which of two words stands under `key`: true for `yes`, and when none does.
  bool either(const std::string& key, const std::string& yes, const std::string& no) {
    const auto word = text(key, yes);
    if (word != yes && word != no) {
      reject(key, yes + " or " + no);
    }
    return word == yes;
  }

  /// The dictionary {`name`: text under `key`}, or what the type of `key` makes of it. Empty when
  /// a text is to be sent and there is none.
  std::optional<MessageDict> payload(const std::string& key, const std::string& name) {
    const auto type = text(key + "_TYPE", "string");
    MessageDict dict;
    if (type == "integer") {
      dict.set(name, std::int64_t{1});
    } else if (type == "boolean") {
      dict.set(name, true);
    } else if (type == "other") {
      dict.set(name, MessageDict::OtherType{});
    } else if (type == "no-dictionary") {
      dict = MessageDict::notADictionary();
    } else if (type == "string") {
      if (!file.settings.contains(key)) {
        return std::nullopt;
      }
      dict.set(name, text(key, ""));
    } else if (type != "missing") {
      reject(key + "_TYPE", "string, integer, boolean, other, missing or no-dictionary");
    }
    return dict;
  }

  /// As `payload`, `fallback` being the text when there is none.
  MessageDict payload(const std::string& key, const std::string& name, const char* fallback) {
    return payload(key, name).value_or(MessageDict::fromEntries({{name, fallback}}));
  }

  /// As `payload`, of what becomes a part of file names.
  std::optional<MessageDict> timestamp(const std::string& key, const std::string& name) {
    auto dict = payload(key, name);
    if (text(key, "").find('/') != std::string::npos) {
      reject(key, "a part of a file name");
    }
    return dict;
  }

  /// All trace properties, by their names: what has a point in its key and is no fault.
  std::map<std::string, MessageDict> traces() {
    std::map<std::string, MessageDict> found;
    for (const auto& [key, setting] : file.settings) {
      const auto name = withoutType(key);
      if (key.find('.') != std::string::npos && !isFault(key) && !found.contains(name)) {
        found[name] = payload(name, vell::kKeyTracePropertyValue, "");
      }
    }
    return found;
  }

  /// All fault plans, by their keys.
  std::map<std::string, FaultPlan> faults() {
    std::map<std::string, FaultPlan> found;
    for (const auto& [key, setting] : file.settings) {
      if (isFault(key) && !readFaultPlan(setting.value, found[key])) {
        reject(key, kFaultWords);
      }
    }
    return found;
  }

 private:
  void complainOf(int line, const std::string& what) const {
    complain(path + ":" + std::to_string(line) + ": " + what);
  }

  void reject(const std::string& key, const std::string& expected) {
    const auto& setting = file.settings.at(key);
    complainOf(setting.line, key + ": \"" + setting.value + "\" is not " + expected);
    failed = true;
  }

  SettingsFile file;
  std::string path;
  bool failed = false;
};

}  // namespace

const std::string* textIn(const MessageDict& dict) {
  return dict.entries().empty() ? nullptr : std::get_if<std::string>(&dict.entries().front().value);
}

std::optional<Profile> readProfile(const std::string& path) {
  Profile profile;
  if (path.empty()) {
    profile.text = kDefaultProfile;
  } else if (!readText(path, profile.text)) {
    return std::nullopt;
  }
  ProfileReader reader(SettingsFile::parse(profile.text), path);
  reader.warn();
  profile.journal = reader.either("JOURNAL", "yes", "no");
  profile.bus = reader.either("BUS", "yes", "no");
  profile.manager = reader.either("MANAGER", "running", "absent");
  profile.helper = reader.either("HELPER", "running", "absent");
  profile.processes = splitWords(reader.text("PROCESSES", "Linkward modemhostd"));
  profile.serverState =
      reader.payload("SERVER_STATE", vell::kKeyServerState, vell::kServerStateStarted);
  profile.traces = reader.traces();
  profile.savedTraces = reader.either("SAVED_TRACES", "yes", "no");
  profile.timestamp = reader.timestamp("TIMESTAMP", vell::kKeyTimestampString);
  profile.helperTimestamp = reader.timestamp("HELPER_TIMESTAMP", vell::helper::kKeyTimestampString);
  profile.faults = reader.faults();
  const auto device = reader.deviceProfile();
  const auto throughput =
      profile.traces.find(std::string(vell::kTraceBaseband) + "." + vell::kKeyTraceHighTput);
  profile.alderRadio = device.radioVendor == kAlderVendor;
  profile.qdssTrace =
      device.radioDiagQdss && throughput != profile.traces.end() && isOn(throughput->second);
  return reader.succeeded() ? std::optional(profile) : std::nullopt;
}

}  // namespace simulator
