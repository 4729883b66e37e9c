// For random journals and random selections, the export is what a plain filter over all entries
// gives: the index neither loses a line nor adds one.

#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <optional>
#include <random>
#include <set>
#include <string>
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
    {"Linkward", "Linkward", "linkward"}, {"/opt/\u1FB3/d", "/opt/\u1FB3/d", "/opt/\u03B1\u03B9/d"},
    {"/usr/lib/vell-helper", "/usr/lib/vell-helper", "/usr/lib/vell-helper"}};
const std::vector<Text> kSearched = {
    {"LINKWARD", "", "linkward"}, {"\u00e4RG", "", "arg"}, {"\u1E9Ee", "", "sse"},
    {"/usr/", "", "/usr/"}, {"/", "", "/"}, {"\xFEy", "", "\uFFFDy"}, {"no such", "", "no such"},
    {"IDENT", "", "ident"}, {"\u0391\u0345/", "", "\u03B1\u03B9/"}};
// clang-format on

struct Chance {
  std::mt19937 engine;

  std::size_t below(std::size_t end) {
    return std::uniform_int_distribution<std::size_t>(0, end - 1)(engine);
  }
  template <typename Value>
  const Value& oneOf(const std::vector<Value>& values) {
    return values[below(values.size())];
  }
};

std::string lastPart(const std::string& path) {
  return path.substr(path.rfind('/') + 1);
}

constexpr long kMinute = 60'000'000;

/// An entry, and what the filter looks at.
struct ModelEntry {
  simulator::JournalEntry stored;
  LogTime time;      ///< What it says, or else when it was stored.
  std::string text;  ///< Tells it from all others in the export.
  std::optional<std::string> process, foldedPath;
};

ModelEntry makeEntry(Chance& chance, long after, const std::string& text, bool isBare) {
  ModelEntry entry{message(after, text), {}, text, {}, {}};
  auto& fields = entry.stored.fields;
  entry.time = entry.stored.time;
  if (chance.below(10) == 0) {
    entry.time -= std::chrono::minutes(chance.below(20));
    const auto time = std::to_string(entry.time.time_since_epoch().count());
    fields.emplace_back("_SOURCE_REALTIME_TIMESTAMP", time);
  }
  const auto add = [&](const char* field, std::size_t percent) {
    const bool has = !isBare && chance.below(100) < percent;
    const auto* const value = has ? &chance.oneOf(kTexts) : nullptr;
    if (has) {
      fields.emplace_back(field, value->stored);
    }
    return value;
  };
  // The later ones count where there are several.
  for (const auto* field : {"SYSLOG_IDENTIFIER", "_COMM"}) {
    if (const auto* name = add(field, 40)) {
      entry.process = name->shown;
    }
  }
  if (const auto* path = add("_EXE", 67)) {
    entry.process = lastPart(path->shown);
    entry.foldedPath = path->folded;
  }
  if (const auto* path = add("VELL_SENDER_IMAGE_PATH", 25)) {
    entry.foldedPath = path->folded;
  }
  return entry;
}

/// Stores journals that share times; some are written to no more. Returns their entries, the oldest
/// first.
std::vector<ModelEntry> storeFiles(Chance& chance, const DeviceJournal& device) {
  const std::size_t longest = chance.oneOf<std::size_t>({40, 400, 4000});
  std::vector<ModelEntry> all;
  for (auto file = static_cast<long>(chance.below(6)); file >= 0; --file) {
    long after = file + kMinute * static_cast<long>(chance.below(2 * longest));
    // Where many entries match it is not the index that is gone by, and that changes on the way.
    std::size_t oneIn = 1;
    StoredEntries stored;
    for (auto count = 1 + chance.below(longest); count > 0; --count) {
      oneIn = chance.below(300) == 0 ? 1 + chance.below(60) : oneIn;
      const auto text = std::to_string(file) + "." + std::to_string(count);
      all.push_back(makeEntry(chance, after, text, chance.below(oneIn) != 0));
      stored.push_back(all.back().stored);
      after += kMinute * static_cast<long>(chance.below(4));
    }
    const auto* kind = chance.below(3) == 0 ? "user-" : "system@";
    device.store(kind + std::to_string(file) + ".journal", stored);
  }
  std::stable_sort(all.begin(), all.end(), [](const auto& left, const auto& right) {
    return left.stored.time < right.stored.time;
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
      words.push_back(whole ? text.stored : lastPart(text.stored));
      names.insert(whole ? text.shown : lastPart(text.shown));
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
  Chance chance{std::mt19937(seed)};
  for (int journals = 0; journals < 6; ++journals) {
    DeviceJournal device;
    const auto stored = storeFiles(chance, device);
    for (int selections = 0; selections < 15; ++selections) {
      const Selection selection(chance);
      // Half a minute is time enough to start an export at the same entry.
      const bool all = chance.below(2) == 0;
      const auto from = chance.oneOf(stored).stored.time + std::chrono::seconds(30);
      const auto history = std::chrono::floor<std::chrono::seconds>(currentTime() - from).count();
      std::string expected;
      for (const auto& entry : stored) {
        const bool selected = (all || entry.time >= from) && selection.selects(entry);
        expected += selected ? entry.text + " " : "";
      }
      const auto result =
          device.run(selection.words, "", all ? kAllOfHistory : std::to_string(history));
      ASSERT_EQ(messagesOf(result.content), expected) << testing::PrintToString(selection.words);
      ASSERT_TRUE(result.status == 0 && result.messages.size() == 1);
    }
  }
}

}  // namespace
