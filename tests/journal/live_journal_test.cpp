// Exports from a journal that changes meanwhile. The output is a pipe, so that the test holds an
// export up, in its middle, by not reading.

#include "tests/journal/device_journal.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

constexpr std::uint64_t kTime = 1'620'133'641'000'000;
constexpr std::size_t kStored = 20000;

std::vector<StoredEntry> entries(std::size_t count, std::uint64_t start, const std::string& text) {
  std::vector<StoredEntry> made;
  for (std::size_t at = 0; at < count; ++at) {
    made.push_back({start + at, {{"MESSAGE", text}, {"_EXE", "/usr/bin/" + text}}});
  }
  return made;
}

/// An export to a pipe that this holds the other end of.
class HeldUpExport {
 public:
  HeldUpExport(const DeviceJournal& device, std::vector<std::string> selection)
      : path(device.root() / "pipe"), pipe(makePipe(path)), process(start(device, selection)) {
    // Its first lines are there, and it cannot have come far.
    while (content.empty()) {
      readSome();
    }
  }

  std::string readToEnd() {
    while (readSome()) {
    }
    return content;
  }

  void closePipe() { pipe = FileDescriptor(); }

  int status() { return process.finish().status; }

 private:
  static FileDescriptor makePipe(const fs::path& path) {
    fs::remove(path);
    EXPECT_EQ(mkfifo(path.c_str(), 0600), 0);
    FileDescriptor end(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    EXPECT_EQ(fcntl(end.get(), F_SETFL, 0), 0);
    return end;
  }

  [[nodiscard]] TestProcess start(const DeviceJournal& device,
                                  std::vector<std::string> selection) const {
    selection.insert(selection.begin(), {kAllOfHistory, path});
    return TestProcess(device.exporting(selection));
  }

  bool readSome() {
    std::array<char, 4096> bytes{};
    const auto size = read(pipe.get(), bytes.data(), bytes.size());
    content.append(bytes.data(), static_cast<std::size_t>(std::max<ssize_t>(size, 0)));
    return size > 0;
  }

  fs::path path;
  FileDescriptor pipe;
  TestProcess process;
  std::string content;
};

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
  for (const auto& selection : {std::vector<std::string>{"-p"}, {"-p", "old", "new"}}) {
    HeldUpExport running(device, selection);
    const auto before = countOf("] new", device.run({"-p", "new"}).content);
    storing.write(exportFormat(entries(100, kTime + kStored + before, "new")));
    awaitStored(device, "new", before + 100);
    const auto content = running.readToEnd();
    EXPECT_EQ(running.status(), 0);
    EXPECT_EQ(countOf("] old", content), kStored + kRotated);
    EXPECT_EQ(countOf("] new", content), before);
  }
  // Nor does what is added meanwhile look like damage.
  for (const auto& message : device.messages()) {
    EXPECT_EQ(message.find("Invalid"), std::string::npos) << message;
  }
}

TEST(LiveJournal, IsReadToItsEndWhenItIsRotatedAway) {
  DeviceJournal device;
  const std::string rotated =
      "system@0123456789abcdef0123456789abcdef-0000000000000001-"
      "0005c17f4b0a2d00.journal";
  device.store(rotated, entries(kStored, kTime, "old"));
  device.store("system.journal", entries(kStored, kTime + kStored, "old"));
  HeldUpExport running(device, {"-p"});
  fs::remove_all(device.journals());
  EXPECT_EQ(countOf("] old", running.readToEnd()), 2 * kStored);
  EXPECT_EQ(running.status(), 0);
}

TEST(LiveJournal, IsReadAsFarAsItIsThereWhenItIsCutShort) {
  const std::vector<std::string> everything = {"-p"};
  const std::vector<std::string> byIndex = {"-p", "old"};
  const struct {
    const char* what;
    std::vector<std::string> selection;
    std::uintmax_t parts;  ///< Of the file's sixteen, those that are left.
  } cases[] = {{"in the middle", everything, 10},
               {"in the middle, of the index", byIndex, 10},
               {"wholly", everything, 0},
               {"wholly, with the index", byIndex, 0}};
  for (const auto& each : cases) {
    SCOPED_TRACE(each.what);
    DeviceJournal device;
    // Few enough of them are selected for the index to be asked, and so many that they are not all
    // read by the time the export is held up.
    auto stored = entries(2 * kStored, kTime, "old");
    for (std::size_t at = 0; at < stored.size(); at += 2) {
      stored[at].fields.back().second = "/usr/bin/other";
    }
    device.store("system.journal", stored);
    const auto whole = device.run(each.selection).content;
    device.messages();
    HeldUpExport running(device, each.selection);
    const auto file = device.journals() / "system.journal";
    fs::resize_file(file, fs::file_size(file) / 16 * each.parts);
    const auto content = running.readToEnd();
    EXPECT_EQ(running.status(), 0);
    EXPECT_LT(content.size(), whole.size());
    EXPECT_EQ(content, whole.substr(0, content.size()));
    EXPECT_EQ(device.messages(),
              (std::vector<std::string>{startedMessage(), "Invalid oslog stream: reason = 1"}));
  }
}

TEST(LiveJournal, EndsWhenNobodyReadsItsPipeAnyMore) {
  DeviceJournal device;
  device.store("system.journal", entries(kStored, kTime, "old"));
  const auto path = (device.root() / "pipe").string();
  HeldUpExport running(device, {"-p"});
  running.closePipe();
  EXPECT_EQ(running.status(), 1);
  EXPECT_EQ(device.messages(),
            (std::vector<std::string>{startedMessage(),
                                      "Failed to write file: " + path + ": Broken pipe"}));
}

}  // namespace
