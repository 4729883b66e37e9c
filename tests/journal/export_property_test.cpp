// For random journals and random selections, the export is what a plain filter over all entries
// gives: the index neither loses a line nor adds one.

#include "platform/clock.h"
#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <optional>
#include <random>
#include <set>
#include <string>
#include <tuple>
#include <vector>

namespace {

/// A text, and how it reads with broken bytes replaced, and with case and diacritics taken away.
struct Text {
  std::string stored, shown, folded;
};

// clang-format off
const std::vector<Text> kTexts = {
    {"/usr/bin/Linkward", "/usr/bin/Linkward", "/usr/bin/linkward"},
    {"/opt/LINKWARD/linkward", "/opt/LINKWARD/linkward", "/opt/linkward/linkward"},
    {"/opt/\u00c4rger/Stra\u00dfe", "/opt/\u00c4rger/Stra\u00dfe", "/opt/arger/strasse"},
    {"/opt/a\u0308rger/STRASSE", "/opt/a\u0308rger/STRASSE", "/opt/arger/strasse"},
    {"/opt/x\xFFy/caf\xE9", "/opt/x\uFFFDy/caf\uFFFD", "/opt/x\uFFFDy/caf\uFFFD"},
    {"caf\xE9", "caf\uFFFD", "caf\uFFFD"}, {"ident", "ident", "ident"}, {"", "", ""},
    {"Linkward", "Linkward", "linkward"}, {"/usr/lib/vell-helper", "/usr/lib/vell-helper", "/usr/lib/vell-helper"}};
const std::vector<Text> kSearched = {
    {"LINKWARD", "", "linkward"}, {"\u00e4RG", "", "arg"}, {"\u1E9Ee", "", "sse"}, {"/usr/", "", "/usr/"},
    {"/", "", "/"}, {"\xFEy", "", "\uFFFDy"}, {"no such", "", "no such"}, {"IDENT", "", "ident"}};
// clang-format on

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

std::string lastComponent(const std::string& path) {
  return path.substr(path.rfind('/') + 1);
}

/// An entry, and what the filter looks at.
struct ModelEntry {
  StoredEntry stored;
  std::string text;  ///< Tells it from all others in the export.
  std::optional<std::string> process, foldedPath;
};

ModelEntry makeEntry(Chance& chance, std::uint64_t realtime, const std::string& text, bool isBare) {
  ModelEntry entry{message(realtime, text), text, {}, {}};
  // The later ones count where there are several.
  for (const auto& [field, percent] :
       {std::pair("SYSLOG_IDENTIFIER", 33), std::pair("_COMM", 50), std::pair("_EXE", 67),
        std::pair("VELL_SENDER_IMAGE_PATH", 25)}) {
    if (isBare || chance.below(100) >= static_cast<std::size_t>(percent)) {
      continue;
    }
    const auto& value = chance.oneOf(kTexts);
    entry.stored.fields.emplace_back(field, value.stored);
    if (percent != 25) {
      entry.process = percent == 67 ? lastComponent(value.shown) : value.shown;
    }
    if (percent == 67 || percent == 25) {
      entry.foldedPath = value.folded;
    }
  }
  return entry;
}

constexpr std::uint64_t kMinute = 60'000'000;

/// Stores journals that share times; some are written to no more. Returns their entries, the oldest
/// first.
std::vector<ModelEntry> storeFiles(Chance& chance, const DeviceJournal& device) {
  const std::size_t longest = chance.oneOf<std::size_t>({40, 400, 4000});
  std::vector<std::tuple<std::uint64_t, std::string, std::vector<ModelEntry>>> files(
      1 + chance.below(6));
  for (auto& [first, name, made] : files) {
    const auto number = std::to_string(&name - &std::get<1>(files.front()));
    name = (chance.below(3) == 0 ? "user-" : "system@") + std::to_string(chance.below(1000)) +
           number + ".journal";
    auto time = first = kTime + kMinute * chance.below(2 * longest);
    // Where many entries match it is not the index that is gone by, and that changes on the way.
    std::size_t oneIn = 1;
    std::vector<StoredEntry> stored;
    for (auto count = 1 + chance.below(longest); count > 0;
         --count, time += kMinute * chance.below(4)) {
      oneIn = chance.below(300) == 0 ? 1 + chance.below(60) : oneIn;
      made.push_back(
          makeEntry(chance, time, number + "." + std::to_string(count), chance.below(oneIn) != 0));
      stored.push_back(made.back().stored);
    }
    device.store(name, stored);
  }
  std::sort(files.begin(), files.end(), [](const auto& left, const auto& right) {
    return std::tie(std::get<0>(left), std::get<1>(left)) <
           std::tie(std::get<0>(right), std::get<1>(right));
  });
  std::vector<ModelEntry> all;
  for (const auto& file : files) {
    all.insert(all.end(), std::get<2>(file).begin(), std::get<2>(file).end());
  }
  std::stable_sort(all.begin(), all.end(), [](const auto& left, const auto& right) {
    return left.stored.realtime < right.stored.realtime;
  });
  return all;
}

/// The words of a selection, and which entries it selects.
struct Selection {
  std::vector<std::string> words = {"-p"};
  std::set<std::string> names;
  std::vector<std::string> searched;

  explicit Selection(Chance& chance) {
    for (auto count = chance.below(4); count > 0; --count) {
      const auto& text = chance.oneOf(kTexts);
      const bool whole = chance.below(2) == 0;
      words.push_back(whole ? text.stored : lastComponent(text.stored));
      names.insert(whole ? text.shown : lastComponent(text.shown));
    }
    words.emplace_back("-i");
    for (auto count = chance.below(3); count > 0; --count) {
      const auto& text = chance.oneOf(kSearched);
      words.push_back(text.stored);
      searched.push_back(text.folded);
    }
  }

  [[nodiscard]] bool selects(const ModelEntry& entry) const {
    return (names.empty() && searched.empty()) ||
           (entry.process && names.contains(*entry.process)) ||
           std::any_of(searched.begin(), searched.end(), [&](const auto& text) {
             return entry.foldedPath && entry.foldedPath->find(text) != std::string::npos;
           });
  }
};

TEST(ExportProperty, IsWhatAPlainFilterGives) {
  const char* chosen = std::getenv("VELL_TEST_SEED");
  const auto seed = chosen != nullptr ? static_cast<unsigned>(std::strtoul(chosen, nullptr, 10))
                                      : std::random_device()();
  SCOPED_TRACE("VELL_TEST_SEED=" + std::to_string(seed));
  Chance chance(seed);
  for (int journals = 0; journals < 6; ++journals) {
    DeviceJournal device;
    const auto all = storeFiles(chance, device);
    for (int selections = 0; selections < 15; ++selections) {
      const Selection selection(chance);
      // Half a minute is time enough to start an export at the same entry.
      const auto from = chance.below(2) == 0 ? 0 : chance.oneOf(all).stored.realtime + kMinute / 2;
      const auto history = currentTime().time_since_epoch() - std::chrono::microseconds(from);
      std::string expected;
      for (const auto& entry : all) {
        expected +=
            entry.stored.realtime >= from && selection.selects(entry) ? entry.text + " " : "";
      }
      const auto result =
          device.run(selection.words, "",
                     from == 0 ? kAllOfHistory : std::to_string(history / std::chrono::seconds(1)));
      ASSERT_EQ(messagesOf(result.content), expected) << testing::PrintToString(selection.words);
    }
  }
}

}  // namespace
