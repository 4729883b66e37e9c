// Each line of a settings file of any bytes: its value beside what the shell makes of it, and a
// device profile of it.

#include "platform/device/device_profile.h"
#include "platform/device/settings_file.h"
#include "tests/fuzz/fuzz_target.h"

#include <wordexp.h>

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr const char* kBlanks = " \t\r\v\f";
  // What we read on purpose as it stands, and the shell does not.
  constexpr std::string_view kExpanded("$`{}\0", 5);
  for (auto line : split({reinterpret_cast<const char*>(data), size}, "\n")) {
    auto file = SettingsFile::parse(line);
    line.erase(0, line.find_first_not_of(kBlanks));
    line.erase(line.find_last_not_of(kBlanks) + 1);
    for (const auto& [key, setting] : file.settings) {
      const auto text = line.substr(key.size() + 1);
      if (text.find_first_of(kExpanded) == std::string::npos) {
        wordexp_t words{};
        require(wordexp(text.c_str(), &words, WRDE_NOCMD) == 0 && words.we_wordc < 2, "no word");
        requireEqual(setting.value, words.we_wordc > 0 ? words.we_wordv[0] : "");
        wordfree(&words);
      }
    }
    DeviceProfile::from(file);
  }
  return 0;
}
