// For random journals and random selections, the export is what a plain filter over all entries
// gives: the index neither loses a line nor adds one.

#include "platform/clock.h"
#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <iterator>
#include <optional>
#include <random>
#include <string>
#include <tuple>
#include <vector>

namespace {

/// A text, and how it reads with broken bytes replaced, and with case and diacritics taken away.
struct Text {
  std::string stored;
  std::string shown;
  std::string folded;
};

const std::vector<Text> kPaths = {
    {"/usr/bin/Linkward", "/usr/bin/Linkward", "/usr/bin/linkward"},
    {"/opt/LINKWARD/linkward", "/opt/LINKWARD/linkward", "/opt/linkward/linkward"},
    {"/opt/\u00c4rger/Stra\u00dfe", "/opt/\u00c4rger/Stra\u00dfe", "/opt/arger/strasse"},
    {"/opt/a\u0308rger/STRASSE", "/opt/a\u0308rger/STRASSE", "/opt/arger/strasse"},
    {"/opt/x\xFFy/caf\xE9", "/opt/x\uFFFDy/caf\uFFFD", "/opt/x\uFFFDy/caf\uFFFD"},
    {"ident", "ident", "ident"},
    {"", "", ""},
    {"/usr/lib/vell-helper", "/usr/lib/vell-helper", "/usr/lib/vell-helper"},
};
const std::vector<std::string> kNames = {"Linkward", "linkward",    "ident", "STRASSE",
                                         "caf\xE9",  "vell-helper", "",      "caf\uFFFD"};
const std::vector<Text> kPathTexts = {
    {"LINKWARD", "", "linkward"}, {"\u00e4RG", "", "arg"}, {"\u1E9Ee", "", "sse"},
    {"/usr/", "", "/usr/"},       {"/", "", "/"},          {"\xFEy", "", "\uFFFDy"},
    {"no such", "", "no such"},   {"IDENT", "", "ident"}};

class Chance {
 public:
  explicit Chance(unsigned seed) : engine(seed) {}

  std::size_t below(std::size_t end) {
    return std::uniform_int_distribution<std::size_t>(0, end - 1)(engine);
  }
  template <typename Value>
  const Value& oneOf(const std::vector<Value>& values) {
    return values[below(values.size())];
  }

 private:
  std::mt19937 engine;
};

std::string shownName(const std::string& name) {
  return name == "caf\xE9" ? "caf\uFFFD" : name;
}

std::string lastComponent(const std::string& path) {
  return path.substr(path.rfind('/') + 1);
}

/// An entry, and what the filter looks at.
struct ModelEntry {
  StoredEntry stored;
  std::string number;  ///< Tells it from all others in the export.
  std::optional<std::string> process;
  std::optional<std::string> foldedPath;
};

ModelEntry makeEntry(Chance& chance, std::uint64_t realtime, const std::string& number) {
  ModelEntry entry{{realtime, {{"MESSAGE", "#" + number}}}, number, {}, {}};
  auto& fields = entry.stored.fields;
  if (chance.below(3) == 0) {
    entry.process = chance.oneOf(kNames);
    fields.emplace_back("SYSLOG_IDENTIFIER", *entry.process);
  }
  if (chance.below(2) == 0) {
    entry.process = chance.oneOf(kNames);
    fields.emplace_back("_COMM", *entry.process);
  }
  if (entry.process) {
    entry.process = shownName(*entry.process);
  }
  if (chance.below(3) != 0) {
    const auto& path = chance.oneOf(kPaths);
    entry.process = lastComponent(path.shown);
    entry.foldedPath = path.folded;
    fields.emplace_back("_EXE", path.stored);
  }
  if (chance.below(4) == 0) {
    const auto& path = chance.oneOf(kPaths);
    entry.foldedPath = path.folded;
    fields.emplace_back("VELL_SENDER_IMAGE_PATH", path.stored);
  }
  std::shuffle(fields.begin(), fields.end(), std::mt19937(realtime));
  return entry;
}

struct ModelFile {
  std::string name;
  std::vector<ModelEntry> entries;
};

constexpr std::uint64_t kMinute = 60'000'000;

/// Journals that share times, in the order of their first entries; some are written to no more.
std::vector<ModelFile> makeFiles(Chance& chance) {
  constexpr std::uint64_t kTime = 1'620'133'641'000'000;
  std::vector<ModelFile> files(1 + chance.below(6));
  const std::size_t longest = chance.oneOf<std::size_t>({40, 400, 4000});
  for (std::size_t file = 0; file < files.size(); ++file) {
    std::uint64_t time = kTime + kMinute * chance.below(2 * longest);
    const auto count = 1 + chance.below(longest);
    // Where many entries match it is not the index that is gone by, and that changes on the way.
    std::size_t oneIn = 1;
    for (std::size_t at = 0; at < count; ++at) {
      time += kMinute * chance.below(4);
      const auto number = std::to_string(file) + "." + std::to_string(at);
      oneIn = chance.below(300) == 0 ? 1 + chance.below(60) : oneIn;
      files[file].entries.push_back(
          chance.below(oneIn) == 0
              ? makeEntry(chance, time, number)
              : ModelEntry{{time, {{"MESSAGE", "#" + number}}}, number, {}, {}});
    }
    files[file].name =
        (chance.below(3) == 0 ? "user-" : "system@") + std::to_string(file) + ".journal";
  }
  std::sort(files.begin(), files.end(), [](const ModelFile& left, const ModelFile& right) {
    return std::tie(left.entries.front().stored.realtime, left.name) <
           std::tie(right.entries.front().stored.realtime, right.name);
  });
  return files;
}

struct Selection {
  std::vector<std::string> names;
  std::vector<Text> pathTexts;

  [[nodiscard]] bool selects(const ModelEntry& entry) const {
    return (names.empty() && pathTexts.empty()) ||
           std::any_of(names.begin(), names.end(),
                       [&](const auto& name) { return entry.process == shownName(name); }) ||
           std::any_of(pathTexts.begin(), pathTexts.end(), [&](const auto& text) {
             return entry.foldedPath && entry.foldedPath->find(text.folded) != std::string::npos;
           });
  }

  [[nodiscard]] std::vector<std::string> words() const {
    std::vector<std::string> made = {"-p"};
    made.insert(made.end(), names.begin(), names.end());
    made.emplace_back("-i");
    for (const auto& text : pathTexts) {
      made.push_back(text.stored);
    }
    return made;
  }
};

Selection makeSelection(Chance& chance) {
  Selection selection;
  for (auto names = chance.below(4); names > 0; --names) {
    selection.names.push_back(chance.oneOf(kNames));
  }
  for (auto texts = chance.below(3); texts > 0; --texts) {
    selection.pathTexts.push_back(chance.oneOf(kPathTexts));
  }
  return selection;
}

std::vector<std::string> expectedNumbers(const std::vector<ModelFile>& files,
                                         const Selection& selection, std::uint64_t from) {
  std::vector<ModelEntry> selected;
  for (const auto& file : files) {
    std::copy_if(file.entries.begin(), file.entries.end(), std::back_inserter(selected),
                 [&](const ModelEntry& entry) {
                   return entry.stored.realtime >= from && selection.selects(entry);
                 });
  }
  std::stable_sort(selected.begin(), selected.end(), [](const auto& left, const auto& right) {
    return left.stored.realtime < right.stored.realtime;
  });
  std::vector<std::string> numbers;
  std::transform(selected.begin(), selected.end(), std::back_inserter(numbers),
                 [](const ModelEntry& entry) { return entry.number; });
  return numbers;
}

std::vector<std::string> numbersIn(const std::string& content) {
  std::vector<std::string> numbers;
  for (auto at = content.find('#'); at != std::string::npos; at = content.find('#', at)) {
    const auto end = content.find('\n', at);
    numbers.push_back(content.substr(at + 1, end - at - 1));
    at = end;
  }
  return numbers;
}

std::string joined(const std::vector<std::string>& words) {
  std::string text;
  for (const auto& word : words) {
    text += "'" + word + "' ";
  }
  return text;
}

TEST(ExportProperty, IsWhatAPlainFilterGives) {
  const char* chosen = std::getenv("VELL_TEST_SEED");
  const auto seed = chosen != nullptr ? static_cast<unsigned>(std::strtoul(chosen, nullptr, 10))
                                      : std::random_device()();
  SCOPED_TRACE("VELL_TEST_SEED=" + std::to_string(seed));
  RecordProperty("seed", std::to_string(seed));
  Chance chance(seed);
  for (int journals = 0; journals < 6; ++journals) {
    DeviceJournal device;
    const auto files = makeFiles(chance);
    for (const auto& file : files) {
      std::vector<StoredEntry> stored;
      std::transform(file.entries.begin(), file.entries.end(), std::back_inserter(stored),
                     [](const ModelEntry& entry) { return entry.stored; });
      device.store(file.name, stored);
    }
    for (int selections = 0; selections < 15; ++selections) {
      const auto selection = makeSelection(chance);
      // Half a minute is time enough to start an export at the same entry.
      const auto from = chance.oneOf(chance.oneOf(files).entries).stored.realtime + kMinute / 2;
      const auto history = currentTime().time_since_epoch() - std::chrono::microseconds(from);
      const bool all = chance.below(2) == 0;
      const auto result =
          device.run(selection.words(), "",
                     all ? kAllOfHistory : std::to_string(history / std::chrono::seconds(1)));
      ASSERT_EQ(numbersIn(result.content), expectedNumbers(files, selection, all ? 0 : from))
          << joined(selection.words());
    }
  }
}

}  // namespace
