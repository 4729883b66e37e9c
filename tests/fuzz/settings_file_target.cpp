// A settings file of any bytes: each line beside what the shell makes of it, the settings written
// and read again, and the device profile that they make.

#include "platform/device/device_profile.h"
#include "platform/device/settings_file.h"
#include "tests/fuzz/fuzz_target.h"

#include <wordexp.h>

#include <algorithm>
#include <cerrno>
#include <map>
#include <regex>

namespace {

/// What the shell makes of `text`; `other` where we read on purpose what the shell does not.
std::string shellValue(const std::string& text, const std::string& other) {
  const bool expands = text.starts_with('"') && text.find_first_of("$`") != std::string::npos;
  if (expands || text.find_first_of(std::string("{}\0", 3)) != std::string::npos) {
    return other;
  }
  wordexp_t words{};
  require(wordexp(text.c_str(), &words, WRDE_NOCMD) == 0 && words.we_wordc < 2,
          "no word of the shell");
  std::string value = words.we_wordc > 0 ? words.we_wordv[0] : "";
  wordfree(&words);
  return value;
}

std::string describe(const std::map<std::string, Setting>& settings) {
  std::string text;
  for (const auto& [key, setting] : settings) {
    text += std::to_string(setting.line) + ":" + key + "=[" + setting.value + "]\n";
  }
  return text;
}

/// The settings of `input`; `file` tells which of its lines are faulty.
std::map<std::string, Setting> model(const std::string& input, SettingsFile file) {
  static const std::regex setting("([A-Za-z0-9_.]+)=([^]*)");
  static const std::regex plain("[-+:/,@%^!A-Za-z0-9_.]*");
  std::map<std::string, Setting> settings;
  int number = 0;
  for (auto line : split(input, "\n")) {
    ++number;
    line.erase(0, std::min(line.find_first_not_of(" \t\r\v\f"), line.size()));
    line.erase(line.find_last_not_of(" \t\r\v\f") + 1);
    const bool fault =
        std::erase_if(file.faults, [&](auto& each) { return each.line == number; }) > 0;
    std::smatch match;
    if (!std::regex_match(line, match, setting)) {
      require(fault == (!line.empty() && line[0] != '#'), "a fault missed, or none");
    } else if (fault) {
      require(!std::regex_match(match.str(2), plain), "a plain value refused");
      settings.erase(match[1]);
    } else {
      // A later line may have the same key.
      const auto& read = file.settings[match[1]];
      settings[match[1]] = {read.line == number ? shellValue(match[2], read.value) : "", number};
    }
  }
  require(file.faults.empty(), "a fault of no line");
  return settings;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string input(data, data + size);
  auto file = SettingsFile::parse(input);
  requireEqual(describe(file.settings), describe(model(input, file)));

  static const std::regex special("[\"$`\\\\]");
  std::string written;
  for (int line = 0; auto& [key, setting] : file.settings) {
    written += key + "=\"" + std::regex_replace(setting.value, special, "\\$&") + "\"\n";
    setting.line = ++line;
  }
  const auto again = SettingsFile::parse(written);
  requireEqual(describe(again.settings), describe(file.settings));

  const auto before = file.faults.size();
  const auto profile = DeviceProfile::from(file);
  const auto radio = file.settings["RADIO_TYPE"].value;
  const auto number = std::strtoll(radio.c_str(), nullptr, 10);
  const bool good =
      std::regex_match(radio, std::regex("-?[0-9]+")) && number == static_cast<int>(number);
  require(profile.radioType == (good ? number : 0), "another radio type");
  require(profile.internalBuild == (file.settings["INTERNAL_BUILD"].value == "yes"),
          "another build");
  require(file.faults.size() <= before + 8, "more faults than keys");
  return 0;
}
