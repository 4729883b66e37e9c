// What an export does when the journal or the file is not as it should be, or changes meanwhile.

#include "platform/files.h"
#include "platform/log_store.h"
#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <future>
#include <random>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

constexpr std::size_t kStored = 20000;
const std::string kLine = "2021-05-04 13:07:21 +0000 0x00000 0x0 0 m(m):(null) [(null)] m\n";
const std::string kExport =
    "TZ=UTC0 exec '" OSLOG_EXPORT_PATH "' " + kAllOfHistory + " /dev/stdout ";
const std::string kTenth = "] tenth\n";

/// Makes a journal file of which every tenth entry is of a program of its own.
fs::path storeTenths(const DeviceJournal& device, const std::string& name) {
  device.store(name, entries(kStored, "tenth", 0, 10));
  return device.journals() / name;
}

/// Runs a line of the shell where the journal files are.
void change(const DeviceJournal& device, const std::string& line) {
  const auto place = "cd '" + device.journals().string() + "' && ";
  EXPECT_EQ(device.runLine(place + line), ProcessResult()) << line;
}

std::string randomBytes(std::size_t count) {
  std::string bytes(count, '\0');
  std::generate(bytes.begin(), bytes.end(), std::mt19937(count));
  return bytes;
}

/// Overwrites a part of a file.
void damage(const fs::path& path, std::size_t start, const std::string& bytes) {
  std::fstream file(path, std::ios::in | std::ios::out | std::ios::binary);
  file.seekp(static_cast<std::streamoff>(start)) << bytes;
}

TEST(ExportFailures, TellWhyThereIsNoJournal) {
  const std::pair<std::string, std::string> cases[] = {
      {"rm -r ../../journal", "No journal files were found"},
      {"rm system.journal", "No journal files were found"},
      {"yes | head -c 9999 >system.journal", "Bad message"},
      {"truncate -s 5000 system.journal", "No data available"},
      {"chmod 0 system.journal", "Permission denied"},
      {"chmod 0 .", "Permission denied"},
      {"cp system.journal user-1000.journal; chmod 0 user-1000.journal", ""}};
  for (const auto& [line, error] : cases) {
    SCOPED_TRACE(line);
    DeviceJournal device;
    device.store("system.journal", entries(3, "m"));
    change(device, line);
    const Export failed{1, "", {"Could not open: " + error, "Failed to prepare oslog stream"}};
    // Permissions bind everybody but root, and root when it has no capabilities.
    EXPECT_EQ(device.run({"-p"}, geteuid() == 0 ? "setpriv --bounding-set=-all" : ""),
              error.empty() ? (Export{0, kLine + kLine + kLine}) : failed);
    EXPECT_EQ(fs::exists(device.output()), error.empty());
    std::error_code ignored;
    fs::permissions(device.journals(), fs::perms(0700), ignored);
  }
}

TEST(ExportFailures, LeaveWhatCanBeReadOfADamagedJournal) {
  DeviceJournal device;
  for (const std::string name : {"system.journal", "system@1.journal"}) {
    const auto file = storeTenths(device, name);
    const auto whole = device.run().content;
    const auto stored = contentOf(file);
    // The times of its first and last entry, as the header has them.
    damage(file, 184, std::string(16, '\0'));
    EXPECT_EQ(device.run().content, whole);
    const auto size = stored.size() / 8 * 3;
    for (const auto& bytes : {randomBytes(size), std::string(size, '\0')}) {
      std::ofstream(file, std::ios::binary) << stored;
      damage(file, stored.size() / 8 * 5, bytes);
      const auto part = device.run();
      EXPECT_LT(part.content.size(), whole.size());
      EXPECT_EQ(part, (Export{0, whole.substr(0, part.content.size()), kIncomplete}));
    }
    fs::remove(file);
  }
  // A whole file beside a damaged one is read all the same, and an empty one is none.
  device.store("user-1000.journal", entries(1, "m"));
  change(device, "yes | head -c 9999 >system.journal; touch user-2000.journal");
  EXPECT_EQ(device.run(), (Export{0, kLine, kIncomplete}));
}

TEST(ExportFailures, FindWithoutItWhatADamagedIndexHasLost) {
  // The tables of a file's fields and of their values, and places in what comes after them.
  std::vector<std::pair<std::size_t, std::string>> places = {{280, std::string(5000, '\0')},
                                                             {5624, std::string(3'700'000, '\0')}};
  for (std::size_t place = 3'750'000; place < 6'000'000; place += 125'000) {
    places.emplace_back(place, randomBytes(1024));
  }
  for (const std::string name : {"system.journal", "system@1.journal"}) {
    DeviceJournal device;
    const auto file = storeTenths(device, name);
    const auto content = contentOf(file);
    for (const auto& [place, bytes] : places) {
      std::ofstream(file, std::ios::binary) << content;
      damage(file, place, bytes);
      const auto expected = countOf(kTenth, device.run().content);
      // It may well find what a walk through the damaged file does not come to.
      EXPECT_GE(countOf(kTenth, device.run({"-p", "tenth"}).content), expected) << name << place;
    }
  }
}

TEST(ExportFailures, DoWithoutTheIndexOfAFileThatACrashLeft) {
  DeviceJournal device;
  const auto file = storeTenths(device, "system@1.journal");
  // How many entries have the value, which stands before its text: it was to be raised last.
  damage(file, contentOf(file).find("_EXE=/usr/bin/tenth") - 16, std::string("\1\0\0", 3));
  fs::rename(file, file.string() + "~");
  EXPECT_EQ(countOf(kTenth, device.run({"-p", "tenth"}).content), kStored / 10);
}

TEST(ExportFailures, GiveUpTheOldestOfMoreFilesThanCanBeOpen) {
  const auto now = currentTime();
  DeviceJournal device;
  std::string all;
  for (int age = 16; age > 0; --age) {
    const auto number = std::to_string(age);
    device.store("system@" + std::to_string(100 - age) + ".journal",
                 {{now - std::chrono::hours(age), {{"MESSAGE", number}}}});
    all += number + " ";
  }
  const auto raised = device.run({"-p"}, "ulimit -Sn 24;");
  EXPECT_EQ(messagesOf(raised.content), all);
  EXPECT_EQ(raised.messages, kStarted);
  const auto limited = device.run({"-p"}, "ulimit -n 24;");
  const auto newest = messagesOf(limited.content);
  EXPECT_TRUE(all.ends_with(" " + newest) && newest.ends_with(" 2 1 ")) << newest;
  EXPECT_EQ(limited.messages, kIncomplete);
  // Files that end before the history are not kept open.
  const auto recent = device.run({"-p"}, "ulimit -n 24;", "9000");
  EXPECT_EQ(messagesOf(recent.content), "2 1 ");
  EXPECT_EQ(recent.messages.size(), 1);
}

TEST(ExportFailures, TellWhatTheFileIsNotFitFor) {
  const std::string created = "Failed to create file: ";
  const std::string written = "Failed to write file: ";
  const struct {
    std::string line, before, after;  ///< What is told, with the path between; or nothing.
  } cases[] = {{"true", "", ""},
               {"head -c 9999 /dev/zero >$O", "", ""},
               {"ln -s target $O", "", ""},
               {"ln -s /dev/null $O", "", ""},
               {"mkdir $O", created, ""},
               {"ln -s none/x $O", created, ""},
               {"mkfifo $O", created, ""},
               {"ln -s /dev/full $O", written, ": No space left on device"}};
  for (const auto& [line, before, after] : cases) {
    SCOPED_TRACE(line);
    DeviceJournal device;
    device.store("system.journal", entries(3, "m"));
    change(device, "O='" + device.output().string() + "' && umask 022 && " + line);
    // A new file is its owner's alone; one that is there stays as open as it was.
    const auto mode = fs::exists(device.output()) ? fs::perms(0644) : fs::perms(0600);
    auto messages = before == created ? std::vector<std::string>() : kStarted;
    if (!before.empty()) {
      messages.push_back(before + device.output().string() + after);
    }
    const auto result = device.run({"-p"}, "umask 0;");
    const bool isFile = fs::is_regular_file(device.output());
    EXPECT_EQ(result,
              (Export{before.empty() ? 0 : 1, isFile ? kLine + kLine + kLine : "", messages}));
    EXPECT_TRUE(!isFile || fs::status(device.output()).permissions() == mode);
  }
}

TEST(ExportFailures, WriteAtTheEndOfAFileThatSomebodyEmptied) {
  const DeviceJournal device;
  createEmptyFile(device.output());
  const auto file = WritableFile::open(device.output());
  ASSERT_FALSE(file->append("one\n"));
  fs::resize_file(device.output(), 0);
  ASSERT_FALSE(file->append("two\n"));
  EXPECT_EQ(fs::file_size(device.output()), 4);
}

TEST(ExportFailures, EndWithReasonOneWhenDeliveringFindsNoMemory) {
  // More entries than are under way at a time, so that the reading waits for room.
  const DeviceJournal device;
  storeTenths(device, "system.journal");
  setenv("VELL_SYSROOT", device.root().c_str(), 1);
  LogReader reader(nullptr);
  std::promise<unsigned long> reason;
  reader.setFlags(kLogReaderStoredOnly | kLogReaderOldestFirst | kLogReaderWholeMessages);
  reader.setEntryHandler([](const LogEntry&) { throw std::bad_alloc(); });
  reader.setInvalidationHandler([&](unsigned long why, LogTime) { reason.set_value(why); });
  reader.activate(LogTime());
  EXPECT_EQ(reason.get_future().get(), kLogReaderReadError);
}

// Exports to a pipe, which the test holds up in their middle by not reading.

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
  device.store("system@1.journal", entries(kStored, "old"));
  device.store("system@2.journal", entries(kStored, "old", kStored));
  auto storing = device.startStoring("system.journal");
  storing.write(exportFormat(entries(kStored, "old", 2 * kStored)));
  awaitStored(device, "old", 3 * kStored);
  // Once reading everything, and once with the help of the index.
  std::size_t before = 0;
  for (const auto* selection : {"-p", "-p old new"}) {
    auto running = startExport(device, selection);
    storing.write(exportFormat(entries(100, "new", 3 * kStored + before)));
    awaitStored(device, "new", before + 100);
    const auto output = running.finish().output;
    EXPECT_EQ(countOf("] old", output), 3 * kStored);
    EXPECT_EQ(countOf("] new", output), before);
    // Nor does what is added meanwhile look like damage.
    EXPECT_EQ(device.messages(), std::vector<std::string>());
    before += 100;
  }
}

TEST(LiveJournal, IsReadAsFarAsItIsThereWhenItIsTakenAway) {
  // The last one is what the journal does when it needs room.
  const struct {
    std::string line;
    bool hasAll, hasLast;  ///< Of the file that is being read, and of one that waits.
  } cases[] = {{"mv $F x && mv system@2.journal y", true, true},
               {"rm *.journal", true, false},
               {"truncate -s 5M $F", false, true},
               {"truncate -s 0 $F", false, true},
               {"exec 3<>$F && rm $F && fallocate -p -l 20M /proc/self/fd/3", false, true}};
  // Few enough of them are selected for the index to be asked, and so many that they are not all
  // read by the time the export is held up.
  const auto stored = entries(2 * kStored, "old", 0, 2);
  for (const std::string name : {"system.journal", "system@1.journal"}) {
    for (const auto& [line, hasAll, hasLast] : cases) {
      for (const std::string selection : {"-p", "-p old"}) {
        SCOPED_TRACE(name + ", " + line + ", " + selection);
        DeviceJournal device;
        device.store(name, stored);
        const auto whole = startExport(device, selection).finish().output;
        device.store("system@2.journal", {message(1'000'000, "m", {{"_EXE", "/bin/old"}})});
        device.messages();
        auto running = startExport(device, selection);
        change(device, "F=" + name + " && " + line);
        const auto output = running.finish().output;
        EXPECT_EQ(output.ends_with("] m\n"), hasLast);
        const auto read = output.substr(
            0, hasLast ? output.rfind('\n', output.size() - 2) + 1 : std::string::npos);
        EXPECT_EQ(read.size() == whole.size(), hasAll);
        EXPECT_TRUE(whole.starts_with(read));
        EXPECT_EQ(device.messages(), hasAll && hasLast ? kStarted : kIncomplete);
      }
    }
  }
}

TEST(LiveJournal, IsLeftWhenItsPipeIsNotRead) {
  DeviceJournal device;
  device.store("system.journal", entries(kStored, "old"));
  const std::string failed = "Failed to write file: ";
  EXPECT_EQ(device.runLine(kExport + "-p | head -n 1; exit ${PIPESTATUS[0]}").status, 1);
  EXPECT_EQ(device.messages().back(), failed + "/dev/stdout: Broken pipe");
#ifndef VELL_SANITIZED
  change(device, "mkfifo '" + device.output().string() + "'");
  const auto start = currentTime();
  const auto result = device.run({"-p"}, "exec 3<>'" + device.output().string() + "';");
  EXPECT_EQ(result.status, 1);
  EXPECT_EQ(result.messages.back(), failed + device.output().string() + ": Connection timed out");
  EXPECT_EQ((currentTime() - start) / std::chrono::seconds(10), 1);
#endif
}

}  // namespace
