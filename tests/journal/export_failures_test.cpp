// What an export does when the journal or the file is not as it should be.

#include "platform/files.h"
#include "platform/log_store.h"
#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <chrono>
#include <fstream>
#include <functional>
#include <future>
#include <new>
#include <random>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

const std::string kLine = "2021-05-04 13:07:21 +0000 0x00000 0x0 0 m(m):(null) [(null)] m\n";

/// Makes a journal of 20000 entries, of which every tenth is of a program of its own.
void storeTenths(const DeviceJournal& device, const std::string& name) {
  device.store(name, entries(20000, "tenth", kTime, 10));
}

void writeFile(const fs::path& path, const std::string& content) {
  std::ofstream(path, std::ios::binary) << content;
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

// clang-format off

TEST(ExportFailures, TellWhyThereIsNoJournal) {
  const struct {
    const char* what;
    std::function<void(const fs::path& folder, const fs::path& file)> prepare;
    std::string error;  ///< None when what can be read is enough.
  } cases[] = {
      {"missing", [](auto& folder, auto&) { fs::remove_all(folder.parent_path()); }, "No journal files were found"},
      {"empty folder", [](auto&, auto& file) { fs::remove(file); }, "No journal files were found"},
      {"garbage", [](auto&, auto& file) { writeFile(file, randomBytes(9999)); }, "Bad message"},
      {"cut off", [](auto&, auto& file) { fs::resize_file(file, 5000); }, "No data available"},
      {"not to be read", [](auto&, auto& file) { fs::permissions(file, fs::perms(0)); }, "Permission denied"},
      {"not to be listed", [](auto& folder, auto&) { fs::permissions(folder, fs::perms(0)); }, "Permission denied"},
      {"one of two not to be read",
       [](auto& folder, auto& file) {
         fs::copy_file(file, folder / "user-1000.journal");
         fs::permissions(folder / "user-1000.journal", fs::perms(0));
       }, ""}};
  // clang-format on
  for (const auto& [what, prepare, error] : cases) {
    SCOPED_TRACE(what);
    DeviceJournal device;
    device.store("system.journal", entries(3, "m"));
    prepare(device.journals(), device.journals() / "system.journal");
    // Permissions bind everybody but root, and root when it has no capabilities.
    const auto result = device.run({"-p"}, geteuid() == 0 ? "setpriv --bounding-set=-all" : "");
    const std::vector failed = {"Could not open: " + error,
                                std::string("Failed to prepare oslog stream")};
    EXPECT_EQ(result.status, error.empty() ? 0 : 1);
    EXPECT_EQ(result.messages, error.empty() ? std::vector{kStarted} : failed);
    EXPECT_EQ(fs::exists(device.output()), error.empty());
    std::error_code ignored;
    fs::permissions(device.journals(), fs::perms(0700), ignored);
  }
}

TEST(ExportFailures, LeaveWhatCanBeReadOfADamagedJournal) {
  DeviceJournal device;
  storeTenths(device, "system.journal");
  const auto file = device.journals() / "system.journal";
  const auto whole = device.run().content;
  const auto content = contentOf(file);
  // The times of its first and last entry, as the header has them.
  damage(file, 184, std::string(16, '\0'));
  EXPECT_EQ(device.run().content, whole);

  writeFile(file, content);
  const auto size = static_cast<std::size_t>(fs::file_size(file));
  damage(file, size / 8 * 5, randomBytes(size / 8 * 3));
  const auto part = device.run();
  EXPECT_EQ(part.messages, (std::vector{kStarted, kIncomplete}));
  EXPECT_LT(part.content.size(), whole.size());
  EXPECT_EQ(part.content, whole.substr(0, part.content.size()));

  // A whole file beside it is read all the same, and an empty one is none.
  device.store("user-1000.journal", entries(10, "m"));
  writeFile(device.journals() / "user-2000.journal", "");
  writeFile(file, randomBytes(9999));
  const auto other = device.run();
  EXPECT_EQ(other.status, 0);
  EXPECT_EQ(other.content.size(), 10 * kLine.size());
  EXPECT_EQ(other.messages, part.messages);
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
    storeTenths(device, name);
    const auto file = device.journals() / name;
    const auto content = contentOf(file);
    for (const auto& [place, bytes] : places) {
      writeFile(file, content);
      damage(file, place, bytes);
      const auto expected = countOf("] tenth", device.run().content);
      // It may well find what a walk through the damaged file does not come to.
      EXPECT_GE(countOf("] tenth", device.run({"-p", "tenth"}).content), expected) << name << place;
    }
  }
}

TEST(ExportFailures, DoWithoutTheIndexOfAFileThatACrashLeft) {
  DeviceJournal device;
  storeTenths(device, "system@1.journal");
  const auto file = device.journals() / "system@1.journal~";
  fs::rename(device.journals() / "system@1.journal", file);
  // How many entries have the value, which stands before its text: it was to be raised last.
  damage(file, contentOf(file).find("_EXE=/usr/bin/tenth") - 16, std::string("\1\0\0", 3));
  EXPECT_EQ(countOf("] tenth", device.run({"-p", "tenth"}).content), 2000);
}

TEST(ExportFailures, TellWhatTheFileIsNotFitFor) {
  const std::string created = "Failed to create file: ";
  const std::string written = "Failed to write file: ";
  // clang-format off
  const struct {
    const char* what;
    std::function<void(const fs::path& output)> prepare;
    std::string before, after;  ///< What the system log is told, with the path between; or nothing.
  } cases[] = {
      {"new", [](const auto&) {}, "", ""},
      {"there", [](const auto& output) { writeFile(output, std::string(9999, 'x')); }, "", ""},
      {"link", [](const auto& output) { fs::create_symlink("target", output); }, "", ""},
      {"folder", [](const auto& output) { fs::create_directory(output); }, created, ""},
      {"in no folder", [](const auto& output) { fs::create_symlink("none/x", output); }, created, ""},
      {"null device", [](const auto& output) { fs::create_symlink("/dev/null", output); }, "", ""},
      {"full disk", [](const auto& output) { fs::create_symlink("/dev/full", output); }, written, ": No space left on device"},
      {"pipe without a reader", [](const auto& output) { mkfifo(output.c_str(), 0600); }, created, ""}};
  // clang-format on
  for (const auto& [what, prepare, before, after] : cases) {
    SCOPED_TRACE(what);
    DeviceJournal device;
    device.store("system.journal", entries(3, "m"));
    prepare(device.output());
    // A new file is its owner's alone; one that is there stays as open as it was.
    const auto mode =
        fs::exists(device.output()) ? fs::status(device.output()).permissions() : fs::perms(0600);
    std::vector messages = {kStarted};
    if (!before.empty()) {
      messages.resize(before == created ? 0 : 1);
      messages.push_back(before + device.output().string() + after);
    }
    const auto result = device.run({"-p"}, "umask 0;");
    EXPECT_EQ(result.status, before.empty() ? 0 : 1);
    EXPECT_EQ(result.messages, messages);
    if (fs::is_regular_file(device.output())) {
      EXPECT_EQ(result.content, kLine + kLine + kLine);
      EXPECT_EQ(fs::status(device.output()).permissions(), mode);
    }
  }
}

TEST(ExportFailures, EndAfterTenSecondsOfAPipeThatIsNotRead) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "the plain build has waited";
#endif
  DeviceJournal device;
  device.store("system.journal", entries(2000, "m"));
  mkfifo(device.output().c_str(), 0600);
  const auto start = std::chrono::steady_clock::now();
  const auto result = device.run({"-p"}, "exec 3<>" + device.output().string() + ";");
  const auto seconds = (std::chrono::steady_clock::now() - start) / std::chrono::seconds(1);
  EXPECT_EQ(result.status, 1);
  EXPECT_EQ(result.messages.back(),
            "Failed to write file: " + device.output().string() + ": Connection timed out");
  EXPECT_TRUE(seconds >= 10 && seconds < 20) << seconds;
}

TEST(ExportFailures, WriteAtTheEndOfAFileThatSomebodyEmptied) {
  const DeviceJournal device;
  writeFile(device.output(), "before\n");
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

}  // namespace
