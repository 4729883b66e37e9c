// Exports from a journal that changes meanwhile. They write to a pipe, so that the test holds them
// up, in their middle, by not reading.

#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

constexpr std::uint64_t kTime = 1'620'133'641'000'000;
constexpr std::size_t kStored = 20000;
const std::string kExport =
    "TZ=UTC0 exec '" OSLOG_EXPORT_PATH "' " + kAllOfHistory + " /dev/stdout ";

std::vector<StoredEntry> entries(std::size_t count, std::uint64_t start, const std::string& text) {
  std::vector<StoredEntry> made;
  for (std::size_t at = 0; at < count; ++at) {
    made.push_back({start + at, {{"MESSAGE", text}, {"_EXE", "/usr/bin/" + text}}});
  }
  return made;
}

/// Starts an export to standard output, which has written its first lines then, and cannot have
/// come far.
TestProcess startExport(const DeviceJournal& device, const std::string& selection) {
  auto process = device.start({"sh", "-c", kExport + selection});
  process.readSome();
  return process;
}

/// Exports until `text` has come as often as `count`.
void awaitStored(DeviceJournal& device, const std::string& text, std::size_t count) {
  while (countOf("] " + text, device.run({"-p", text}).content) < count) {
  }
}

TEST(LiveJournal, EndsAtWhatWasStoredAtItsStart) {
  DeviceJournal device;
  // The export is held up in the first of the two files that are written to no more.
  constexpr std::size_t kRotated = 2 * kStored;
  device.store("system@1.journal", entries(kStored, kTime - kRotated, "old"));
  device.store("system@2.journal", entries(kStored, kTime - kStored, "old"));
  auto storing = device.startStoring("system.journal");
  storing.write(exportFormat(entries(kStored, kTime, "old")));
  awaitStored(device, "old", kStored + kRotated);
  // Once reading everything, and once with the help of the index.
  for (const auto* selection : {"-p", "-p old new"}) {
    auto running = startExport(device, selection);
    const auto before = countOf("] new", device.run({"-p", "new"}).content);
    storing.write(exportFormat(entries(100, kTime + kStored + before, "new")));
    awaitStored(device, "new", before + 100);
    const auto [status, output, errors] = running.finish();
    EXPECT_EQ(status, 0);
    EXPECT_EQ(countOf("] old", output), kStored + kRotated);
    EXPECT_EQ(countOf("] new", output), before);
    // Nor does what is added meanwhile look like damage.
    EXPECT_EQ(device.messages(), std::vector<std::string>());
  }
}

TEST(LiveJournal, IsReadToItsEndWhenItIsRotatedAway) {
  DeviceJournal device;
  device.store("system@1.journal", entries(kStored, kTime, "old"));
  device.store("system.journal", entries(kStored, kTime + kStored, "old"));
  auto running = startExport(device, "-p");
  fs::remove_all(device.journals());
  const auto result = running.finish();
  EXPECT_EQ(countOf("] old", result.output), 2 * kStored);
  EXPECT_EQ(result.status, 0);
}

TEST(LiveJournal, IsReadAsFarAsItIsThereWhenItIsCutShort) {
  // Few enough of them are selected for the index to be asked, and so many that they are not all
  // read by the time the export is held up.
  auto stored = entries(2 * kStored, kTime, "old");
  for (std::size_t at = 0; at < stored.size(); at += 2) {
    stored[at].fields.back().second = "/usr/bin/other";
  }
  for (const std::string selection : {"-p", "-p old"}) {
    for (const unsigned sixteenthsLeft : {10U, 0U}) {
      SCOPED_TRACE(selection + " " + std::to_string(sixteenthsLeft));
      DeviceJournal device;
      device.store("system.journal", stored);
      const auto whole = startExport(device, selection).finish().output;
      device.messages();
      auto running = startExport(device, selection);
      const auto file = device.journals() / "system.journal";
      fs::resize_file(file, fs::file_size(file) / 16 * sixteenthsLeft);
      const auto [status, output, errors] = running.finish();
      EXPECT_EQ(status, 0);
      EXPECT_LT(output.size(), whole.size());
      EXPECT_EQ(output, whole.substr(0, output.size()));
      EXPECT_EQ(device.messages(), (std::vector{kStarted, kIncomplete}));
    }
  }
}

TEST(LiveJournal, EndsWhenNobodyReadsItsPipeAnyMore) {
  DeviceJournal device;
  device.store("system.journal", entries(kStored, kTime, "old"));
  EXPECT_EQ(device.runLine(kExport + "-p | head -n 1; exit ${PIPESTATUS[0]}").status, 1);
  EXPECT_EQ(device.messages(),
            (std::vector<std::string>{kStarted, "Failed to write file: /dev/stdout: Broken pipe"}));
}

}  // namespace
