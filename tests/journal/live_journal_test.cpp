// Exports from a journal that changes meanwhile. They write to a pipe, so that the test holds them
// up, in their middle, by not reading.

#include "tests/journal/device_journal.h"

#include <fcntl.h>
#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

constexpr std::size_t kStored = 20000;
const std::string kExport =
    "TZ=UTC0 exec '" OSLOG_EXPORT_PATH "' " + kAllOfHistory + " /dev/stdout ";

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

/// Removes a file as the journal does when it needs room.
void vacuum(const fs::path& path) {
  const FileDescriptor file(open(path.c_str(), O_RDWR | O_CLOEXEC));
  const auto size = static_cast<off_t>(fs::file_size(path));
  fs::remove(path);
  EXPECT_EQ(fallocate(file.get(), FALLOC_FL_PUNCH_HOLE | FALLOC_FL_KEEP_SIZE, 0, size), 0);
}

TEST(LiveJournal, EndsAtWhatWasStoredAtItsStart) {
  DeviceJournal device;
  // The export is held up in the first of the two files that are written to no more.
  constexpr std::size_t kRotated = 2 * kStored;
  device.store("system@1.journal", entries(kStored, "old", kTime - kRotated));
  device.store("system@2.journal", entries(kStored, "old", kTime - kStored));
  auto storing = device.startStoring("system.journal");
  storing.write(exportFormat(entries(kStored, "old")));
  awaitStored(device, "old", kStored + kRotated);
  // Once reading everything, and once with the help of the index.
  for (const auto* selection : {"-p", "-p old new"}) {
    auto running = startExport(device, selection);
    const auto before = countOf("] new", device.run({"-p", "new"}).content);
    storing.write(exportFormat(entries(100, "new", kTime + kStored + before)));
    awaitStored(device, "new", before + 100);
    const auto [status, output, errors] = running.finish();
    EXPECT_EQ(status, 0);
    EXPECT_EQ(countOf("] old", output), kStored + kRotated);
    EXPECT_EQ(countOf("] new", output), before);
    // Nor does what is added meanwhile look like damage.
    EXPECT_EQ(device.messages(), std::vector<std::string>());
  }
}

TEST(LiveJournal, IsReadToItsEndWhenItIsRemoved) {
  DeviceJournal device;
  device.store("system@1.journal", entries(kStored, "old"));
  device.store("system.journal", entries(kStored, "old", kTime + kStored));
  auto running = startExport(device, "-p");
  fs::remove_all(device.journals());
  const auto result = running.finish();
  EXPECT_EQ(countOf("] old", result.output), 2 * kStored);
  EXPECT_EQ(device.messages(), std::vector{kStarted});
}

TEST(LiveJournal, IsReadAsFarAsItIsThereWhenItIsCutShortOrVacuumed) {
  const std::pair<std::string, std::function<void(const fs::path&)>> cases[] = {
      {"cut short", [](const auto& path) { fs::resize_file(path, fs::file_size(path) / 16 * 10); }},
      {"emptied", [](const auto& path) { fs::resize_file(path, 0); }},
      {"vacuumed", vacuum}};
  // Few enough of them are selected for the index to be asked, and so many that they are not all
  // read by the time the export is held up.
  const auto stored = entries(2 * kStored, "old", kTime, 2);
  for (const std::string selection : {"-p", "-p old"}) {
    for (const std::string name : {"system.journal", "system@1.journal"}) {
      for (const auto& [what, take] : cases) {
        SCOPED_TRACE(what + ", " + name + ", " + selection);
        DeviceJournal device;
        device.store(name, stored);
        const auto whole = startExport(device, selection).finish().output;
        // What comes after the gap is not lost.
        device.store("user-1000.journal",
                     {message(kTime + 2 * kStored, "last", {{"_EXE", "old"}})});
        device.messages();
        auto running = startExport(device, selection);
        take(device.journals() / name);
        const auto [status, output, errors] = running.finish();
        EXPECT_EQ(status, 0);
        const auto gap = output.rfind('\n', output.size() - 2) + 1;
        EXPECT_LT(gap, whole.size());
        EXPECT_EQ(output.substr(0, gap), whole.substr(0, gap));
        EXPECT_TRUE(output.ends_with("] last\n")) << output.substr(gap);
        EXPECT_EQ(device.messages(), (std::vector{kStarted, kIncomplete}));
      }
    }
  }
}

TEST(LiveJournal, EndsWhenNobodyReadsItsPipeAnyMore) {
  DeviceJournal device;
  device.store("system.journal", entries(kStored, "old"));
  EXPECT_EQ(device.runLine(kExport + "-p | head -n 1; exit ${PIPESTATUS[0]}").status, 1);
  EXPECT_EQ(device.messages(),
            (std::vector<std::string>{kStarted, "Failed to write file: /dev/stdout: Broken pipe"}));
}

}  // namespace
