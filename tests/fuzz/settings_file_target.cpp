// A settings file of any bytes: each value beside what the shell makes of it, the settings written
// and read again, and a device profile of them.

#include "platform/device/device_profile.h"
#include "platform/device/settings_file.h"
#include "tests/fuzz/fuzz_target.h"

#include <wordexp.h>

#include <map>

namespace {

/// What the shell makes of `text`; `other` where we read on purpose what the shell does not.
std::string shellValue(const std::string& text, const std::string& other) {
  const bool expands = text.starts_with('"') && text.find_first_of("$`") != std::string::npos;
  if (expands || text.find_first_of(std::string("{}\0", 3)) != std::string::npos) {
    return other;
  }
  wordexp_t words{};
  require(wordexp(text.c_str(), &words, WRDE_NOCMD) == 0 && words.we_wordc < 2, "no shell word");
  std::string value = words.we_wordc > 0 ? words.we_wordv[0] : "";
  wordfree(&words);
  return value;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr const char* kBlanks = " \t\r\v\f";
  const std::string input(data, data + size);
  auto file = SettingsFile::parse(input);
  const auto lines = split(input, "\n");
  std::string written;
  for (const auto& [key, setting] : file.settings) {
    auto line = lines.at(static_cast<std::size_t>(setting.line) - 1);
    line.erase(0, line.find_first_not_of(kBlanks));
    line.erase(line.find_last_not_of(kBlanks) + 1);
    require(line.starts_with(key + "="), "another line");
    requireEqual(setting.value, shellValue(line.substr(key.size() + 1), setting.value));
    written += key + "=\"";
    for (const char character : setting.value) {
      written += std::string("\"$`\\").find(character) == std::string::npos ? "" : "\\";
      written += character;
    }
    written += "\"\n";
  }
  const auto again = SettingsFile::parse(written);
  require(again.faults.empty() && again.settings.size() == file.settings.size(), "not read again");
  for (const auto& [key, setting] : again.settings) {
    requireEqual(setting.value, file.settings.at(key).value);
  }

  // A line by itself gives the same fault, or a setting: the last of its key, unless that is
  // faulty.
  std::map<std::string, int> last;
  auto fault = file.faults.begin();
  for (int number = 1; const auto& line : lines) {
    const auto alone = SettingsFile::parse(line);
    for (const auto& [key, setting] : alone.settings) {
      last[key] = number;
    }
    const bool faulty = fault != file.faults.end() && fault->line == number;
    require(alone.faults.size() == (faulty ? 1 : 0), "a fault missed, or none");
    fault += faulty ? 1 : 0;
    ++number;
  }
  require(fault == file.faults.end(), "a fault of no line");
  for (const auto& [key, number] : last) {
    const auto found = file.settings.find(key);
    require(found == file.settings.end() ? !file.faults.empty() && file.faults.back().line > number
                                         : found->second.line == number,
            "not the last line of a key");
  }
  DeviceProfile::from(file);
  return 0;
}
