// For journals and selections chosen at random, the export is what a plain filter over all entries
// gives: neither the index nor the search for copies loses a line or adds one.

#include "platform/journal/journal_fields.h"
#include "platform/unicode/utf8.h"
#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace {

/// A text, and how it reads with case and diacritics taken away, and broken bytes replaced.
struct Text {
  std::string stored, folded;
};

// clang-format off
const std::vector<Text> kTexts = {
    {"/usr/bin/Linkward", "/usr/bin/linkward"}, {"/opt/LINKWARD/linkward", "/opt/linkward/linkward"},
    {"/opt/\u00c4rger/Stra\u00dfe", "/opt/arger/strasse"},
    {"/opt/a\u0308rger/STRASSE", "/opt/arger/strasse"}, {"/opt/\u1FB3/d", "/opt/\u03B1\u03B9/d"},
    {"/opt/x\xFFy/caf\xE9", "/opt/x\uFFFDy/caf\uFFFD"}, {"caf\xE9", "caf\uFFFD"}, {"", ""},
    {"ident", "ident"}, {"Linkward", "linkward"}, {"/usr/lib/vell-helper", "/usr/lib/vell-helper"}};
const std::vector<Text> kSearched = {
    {"LINKWARD", "linkward"}, {"\u00e4RG", "arg"}, {"\u1E9Ee", "sse"}, {"/usr/", "/usr/"},
    {"/", "/"}, {"\xFEy", "\uFFFDy"}, {"no such", "no such"}, {"IDENT", "ident"},
    {"\u0391\u0345/", "\u03B1\u03B9/"}};
// clang-format on

using Chance = std::mt19937;

const Text& oneOf(const std::vector<Text>& texts, Chance& chance) {
  return texts[chance() % texts.size()];
}

/// An entry, and what a filter looks at.
struct ModelEntry {
  simulator::JournalEntry stored;  ///< Its message comes first.
  LogTime time;                    ///< What it says, or else when it was stored.
  std::string process = "nobody", foldedPath = {};
};

/// An entry that has one in `oneIn` of the fields.
ModelEntry makeEntry(Chance& chance, long after, const std::string& text, std::size_t oneIn) {
  ModelEntry entry{message(after, text), kTime + std::chrono::microseconds(after)};
  auto& fields = entry.stored.fields;
  if (chance() % 10 == 0) {
    entry.time -= std::chrono::minutes(chance() % 20);
    const auto time = std::to_string(entry.time.time_since_epoch().count());
    fields.emplace_back("_SOURCE_REALTIME_TIMESTAMP", time);
  }
  // Of several names the last one counts, and of several paths.
  for (const std::string field : {"SYSLOG_IDENTIFIER", "_COMM", "_EXE", "VELL_SENDER_IMAGE_PATH"}) {
    if (chance() % oneIn == 0) {
      const auto& [value, folded] = oneOf(kTexts, chance);
      const bool isSender = field.starts_with("VELL");
      const bool isPath = isSender || field == "_EXE";
      fields.emplace_back(field, value);
      entry.foldedPath = isPath ? folded : entry.foldedPath;
      entry.process = isSender ? entry.process : validUtf8(isPath ? lastComponent(value) : value);
    }
  }
  return entry;
}

/// Stores journals whose entries lie between each other's and are, perhaps, stored twice; some are
/// written to no more. Returns the entries, the oldest first.
std::vector<ModelEntry> storeFiles(Chance& chance, DeviceJournal& device) {
  constexpr long kMinute = 60'000'000;
  std::vector<ModelEntry> all;
  for (auto file = static_cast<long>(chance() % 6); file >= 0; --file) {
    const auto count = 1 + (4 << chance() % 11);
    long after = file + kMinute * static_cast<long>(chance() % 2000);
    // Where many entries match it is not the index that is gone by, and that changes on the way.
    std::size_t oneIn = 2;
    StoredEntries stored;
    for (int at = 0; at < count; ++at) {
      oneIn = chance() % 300 == 0 ? 2 + chance() % 120 : oneIn;
      const auto text = std::to_string(file) + "." + std::to_string(at);
      all.push_back(makeEntry(chance, after, text, oneIn));
      stored.push_back(all.back().stored);
      after += kMinute * static_cast<long>(chance() % 4);
    }
    const auto name = (chance() % 2 == 0 ? "user-" : "system@") + std::to_string(file);
    device.store(name + ".journal", stored);
    // Copied whole, and entry by entry, as from memory to the disk.
    if (chance() % 2 == 0) {
      device.change("cd $J && cp " + name + ".journal " + name + "@.journal~");
      device.store(name + "x.journal", stored);
    }
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
    for (auto count = chance() % 4; count > 0; --count) {
      const std::string_view text = oneOf(kTexts, chance).stored;
      words.emplace_back(chance() % 2 == 0 ? text : lastComponent(text));
      names.insert(validUtf8(words.back()));
    }
    words.emplace_back("-i");
    for (auto count = chance() % 3; count > 0; --count) {
      const auto& [typed, folded] = oneOf(kSearched, chance);
      words.push_back(typed);
      searched.push_back(folded);
    }
  }

  [[nodiscard]] bool selects(const ModelEntry& entry) const {
    return (names.empty() && searched.empty()) || names.contains(entry.process) ||
           std::any_of(searched.begin(), searched.end(), [&](const auto& text) {
             return entry.foldedPath.find(text) != std::string::npos;
           });
  }
};

TEST(ExportProperty, IsWhatAPlainFilterGives) {
#ifdef VELL_SANITIZED
  constexpr int kRounds = 4;
#else
  constexpr int kRounds = 12;
#endif
  Chance chance;
  for (int round = 0; round < kRounds; ++round) {
    DeviceJournal device;
    const auto stored = storeFiles(chance, device);
    for (int selections = 0; selections < 6; ++selections) {
      const Selection selection(chance);
      // Half a minute is time enough to start an export at the same entry.
      const auto& first = stored[chance() % 3 * (stored.size() - 1) / 2].stored;
      const auto from = first.time - std::chrono::seconds(30);
      const auto age = std::chrono::floor<std::chrono::seconds>(currentTime() - from);
      const auto history = std::to_string(age.count());
      std::string expected;
      for (const auto& entry : stored) {
        const bool selected = entry.time >= from && selection.selects(entry);
        expected += selected ? entry.stored.fields[0].second + " " : "";
      }
      ASSERT_EQ(lastWords(device.run(selection.words, "H=" + history + ";")),
                expected + history + ".000000 ")
          << testing::PrintToString(selection.words);
    }
  }
}

}  // namespace
