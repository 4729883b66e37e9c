// What an export does when the journal or the file is not as it should be.

#include "platform/files.h"
#include "platform/log_store.h"
#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <fstream>
#include <functional>
#include <future>
#include <new>
#include <random>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

const std::string kLine =
    "2021-05-04 13:07:21 +0000 0x00000 0x0 0 (null)((null)):(null) [(null)] m\n";

std::vector<StoredEntry> entries(std::size_t count) {
  return std::vector<StoredEntry>(count, {1'620'133'641'000'000, {{"MESSAGE", "m"}}});
}

/// Makes a journal of 20000 entries, of which every tenth has a name of its own.
void storeTenths(const DeviceJournal& device, const std::string& name) {
  auto stored = entries(20000);
  for (std::size_t at = 0; at < stored.size(); ++at) {
    stored[at].realtime += at;
    stored[at].fields.emplace_back("SYSLOG_IDENTIFIER", at % 10 == 0 ? "tenth" : "other");
  }
  device.store(name, stored);
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
  const auto system = [](const fs::path& journals) { return journals / "system.journal"; };
  const struct {
    const char* what;
    std::function<void(const fs::path& journals)> prepare;
    std::string error;  ///< None when what can be read is enough.
  } cases[] = {
      {"missing", [](const auto& journals) { fs::remove_all(journals.parent_path()); }, "No journal files were found"},
      {"empty folder", [&](const auto& journals) { fs::remove(system(journals)); }, "No journal files were found"},
      {"garbage", [&](const auto& journals) { writeFile(system(journals), randomBytes(9999)); }, "Bad message"},
      {"cut off", [&](const auto& journals) { fs::resize_file(system(journals), 5000); }, "No data available"},
      {"not to be read", [&](const auto& journals) { fs::permissions(system(journals), fs::perms(0)); }, "Permission denied"},
      {"not to be listed", [](const auto& journals) { fs::permissions(journals, fs::perms(0)); }, "Permission denied"},
      {"one of two not to be read",
       [&](const auto& journals) {
         fs::copy_file(system(journals), journals / "user-1000.journal");
         fs::permissions(journals / "user-1000.journal", fs::perms(0));
       }, ""},
  };
  // clang-format on
  for (const auto& each : cases) {
    SCOPED_TRACE(each.what);
    DeviceJournal device;
    device.store("system.journal", entries(3));
    each.prepare(device.journals());
    // Permissions bind everybody but root, and root when it has no capabilities.
    const auto result = device.run({"-p"}, geteuid() == 0 ? "setpriv --bounding-set=-all" : "");
    const bool exported = each.error.empty();
    std::vector messages = {kStarted};
    if (!exported) {
      messages = {"Could not open: " + each.error, "Failed to prepare oslog stream"};
    }
    EXPECT_EQ(result.status, exported ? 0 : 1);
    EXPECT_EQ(result.messages, messages);
    EXPECT_EQ(fs::exists(device.output()), exported);
    std::error_code ignored;
    fs::permissions(device.journals(), fs::perms(0700), ignored);
  }
}

TEST(ExportFailures, LeaveWhatCanBeReadOfADamagedJournal) {
  DeviceJournal device;
  storeTenths(device, "system.journal");
  const auto file = device.journals() / "system.journal";
  const auto whole = device.run();
  ASSERT_EQ(countOf("] m\n", whole.content), 20000);

  const auto size = static_cast<std::size_t>(fs::file_size(file));
  damage(file, size / 8 * 5, randomBytes(size / 8 * 3));
  const auto part = device.run();
  EXPECT_EQ(part.status, 0);
  EXPECT_EQ(part.messages, (std::vector{kStarted, kIncomplete}));
  EXPECT_LT(part.content.size(), whole.content.size());
  EXPECT_EQ(part.content, whole.content.substr(0, part.content.size()));

  // A whole file beside it is read all the same.
  device.store("user-1000.journal", entries(10));
  writeFile(file, randomBytes(9999));
  const auto other = device.run();
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
  for (const auto* name : {"system.journal", "system@1.journal"}) {
    DeviceJournal device;
    storeTenths(device, name);
    const auto file = device.journals() / name;
    const auto content = contentOf(file);
    for (const auto& [place, bytes] : places) {
      SCOPED_TRACE(name + (" at " + std::to_string(place)));
      writeFile(file, content);
      damage(file, place, bytes);
      const auto expected = countOf("[tenth]", device.run().content);
      // It may well find what a walk through the damaged file does not come to.
      EXPECT_GE(countOf("[tenth]", device.run({"-p", "tenth"}).content), expected);
    }
  }
}

TEST(ExportFailures, DoWithoutTheIndexOfAFileThatACrashLeft) {
  DeviceJournal device;
  storeTenths(device, "system@1.journal");
  const auto file = device.journals() / "system@1.journal~";
  fs::rename(device.journals() / "system@1.journal", file);
  // How many entries have the value, which stands before its text: it was to be raised last.
  damage(file, contentOf(file).find("SYSLOG_IDENTIFIER=tenth") - 16, std::string("\1\0\0", 3));
  EXPECT_EQ(countOf("[tenth]", device.run({"-p", "tenth"}).content), 2000);
}

TEST(ExportFailures, TellWhatTheFileIsNotFitFor) {
  const std::string created = "Failed to create file: ";
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
      {"full disk", [](const auto& output) { fs::create_symlink("/dev/full", output); },
       "Failed to write file: ", ": No space left on device"},
      {"unread pipe", [](const auto& output) { ASSERT_EQ(mkfifo(output.c_str(), 0600), 0); }, created, ""},
  };
  // clang-format on
  for (const auto& [what, prepare, before, after] : cases) {
    SCOPED_TRACE(what);
    DeviceJournal device;
    device.store("system.journal", entries(3));
    prepare(device.output());
    std::vector messages = {kStarted};
    if (!before.empty()) {
      messages.resize(before == created ? 0 : 1);
      messages.push_back(before + device.output().string() + after);
    }
    const auto result = device.run();
    EXPECT_EQ(result.status, before.empty() ? 0 : 1);
    EXPECT_EQ(result.messages, messages);
    EXPECT_EQ(result.content, fs::is_regular_file(device.output()) ? kLine + kLine + kLine : "");
  }
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

TEST(ExportFailures, KeepANewFileToItsOwner) {
  DeviceJournal device;
  device.store("system.journal", entries(1));
  device.run({"-p"}, "umask 0;");
  EXPECT_EQ(fs::status(device.output()).permissions(), fs::perms(0600));
  // One that is there stays as open as it was.
  fs::permissions(device.output(), fs::perms(0644));
  EXPECT_EQ(device.run().content, kLine);
  EXPECT_EQ(fs::status(device.output()).permissions(), fs::perms(0644));
}

}  // namespace
