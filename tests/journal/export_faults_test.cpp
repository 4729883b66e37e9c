// What an export does when the journal or the file is not as it should be, or changes meanwhile.

#include "platform/files.h"
#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <fstream>

namespace {

namespace fs = std::filesystem;
using namespace std::literals;

constexpr std::size_t kStored = 20000;

// clang-format off

TEST(ExportFailures, TellWhatTheJournalOrTheFileIsNotFitFor) {
  const std::string text(100'000, 'm');
  const auto line = "2021-05-04 13:07:21 +0000 0x00000 0x0 0 (null)((null)):(null) [(null)] " + text + "\n";
  const auto closed = [](const std::string& error) {
    return "Could not open: " + error + "\nFailed to prepare oslog stream\nstatus 1\n";
  };
  const std::string notCreated = "Failed to create file: out.txt\nstatus 1\n";
  const auto notWritten = kStarted + "Failed to write file: out.txt: ";
  // What is done before; the file's content, what the system log gets, the file's permissions.
  const std::pair<std::string, std::string> cases[] = {
      {"rm -r var/log/journal", closed("No journal files were found")},
      {"rm $J/system.journal", closed("No journal files were found")},
      {"yes | head -c 9999 >$J/system.journal", closed("system.journal: not a journal")},
      {"truncate -s 5000 $J/system.journal", closed("system.journal: damaged at its head")},
      {"chmod 0 $J/system.journal", closed("system.journal: Permission denied")},
      {"chmod 0 $J", closed(kJournals.filename().string() + ": Permission denied")},
      {"cp $J/system.journal $J/a.journal; chmod 0 $J/a.journal",
       line + incomplete("a.journal: Permission denied") + "600\n"},
      // An empty file is none yet.
      {"touch $J/b.journal", line + kStarted + "600\n"},
      {"yes | head -c 9999 >$J/a.journal; touch $J/b.journal",
       line + incomplete("a.journal: not a journal") + "600\n"},
      // A new file is its owner's alone; one that is there stays as open as it was.
      {"true", line + kStarted + "600\n"},
      {"ln -s target out.txt", line + kStarted + "600\n"},
      {"yes | head -c 300000 >out.txt; chmod 644 out.txt", line + kStarted + "644\n"},
      {"ln -s /dev/null out.txt", kStarted},
      {"ln -s /dev/full out.txt", notWritten + "No space left on device\nstatus 1\n"},
      {"mkdir out.txt", notCreated},
      {"ln -s none/x out.txt", notCreated},
      {"mkfifo out.txt", notCreated},
      {"mkfifo out.txt; head -c 1 out.txt >first & exec 3>out.txt",
       notWritten + "Broken pipe\nstatus 1\n"},
#ifndef VELL_SANITIZED
      // A damaged size, which is allocated: a sanitizer ends the process then.
      {R"(LC_ALL=C sed -i 's/\x28\xb5\x2f\xfd./\x28\xb5\x2f\xfd\xe0/' $J/system.journal)",
       incomplete("system.journal: has a damaged entry") + "600\n"},
      // Ten seconds in all, however often there is room for a little.
      {"mkfifo out.txt; exec 3<>out.txt; for n in {1..8}; do sleep 1.5; head -c 4096 <&3; done >first & :",
       notWritten + "Connection timed out\nstatus 1\n"},
#endif
  };
  // clang-format on
  // Permissions bind everybody but root, and root when it has no capabilities.
  const std::string bound = geteuid() == 0 ? "setpriv --bounding-set=-all" : "";
  for (const auto& [change, expected] : cases) {
    DeviceJournal device;
    device.store("system.journal", {message(0, text)});
    const auto start = currentTime();
    const auto told = device.run({"-p"}, change + "; umask 0; " + bound);
    EXPECT_TRUE(change.find("sleep") == std::string::npos || (currentTime() - start) / 10s == 1);
    const auto mode = device.change("chmod -f 700 $J; [ ! -f out.txt ] || stat -Lc %a out.txt");
    EXPECT_EQ(told + mode, expected) << change;
  }
}

TEST(ExportFailures, LeaveWhatCanBeReadOfADamagedJournal) {
  const auto linesOf = [](const std::string& result) {
    return result.substr(0, result.find("Getting"));
  };
  for (const std::string name : {"system.journal", "system@1.journal"}) {
    SCOPED_TRACE(name);
    DeviceJournal device;
    device.store(name, entries(kStored, "tenth", 0, 10));
    const auto file = device.root() / kJournals / name;
    const auto stored = contentOf(file);
    const auto whole = device.run();
    const auto runDamaged = [&](std::size_t place, const std::string& bytes) {
      std::ofstream(file) << std::string(stored).replace(place, bytes.size(), bytes);
      return device.run();
    };
    // The times of its first and last entry, as the header has them. The library of Debian 12 (252)
    // makes no use of them, that of Debian 13 (257) does not open a file without them. The export's
    // file is then as the one before left it.
    const auto unopened = "Could not open: " + name +
                          ": damaged at its head\nFailed to prepare oslog stream\nstatus 1\n";
    EXPECT_EQ(linesOf(runDamaged(184, std::string(16, '\0'))),
              linesOf(whole) + (JOURNAL_VERSION < 257 ? "" : unopened));
    const auto end = stored.size() / 8 * 5;
    for (const auto byte : {'\0', '\xA7'}) {
      const auto part = runDamaged(end, std::string(stored.size() - end, byte));
      EXPECT_LT(part.size(), whole.size());
      EXPECT_EQ(part, whole.substr(0, linesOf(part).size()) +
                          incomplete(name + ": ends before its last entry"));
    }
    // The tables of its fields and of their values, to the end, as a file's own hash says where a
    // value is; and places in what comes behind. Without the index, a selection may well find what
    // a walk through the file does not come to.
    const std::pair<std::size_t, std::size_t> places[] = {{280, 5000},       {5624, 3'728'240},
                                                          {3'750'000, 1024}, {4'250'000, 1024},
                                                          {4'750'000, 1024}, {5'250'000, 1024}};
    for (const auto& [place, length] : places) {
      const auto found = linesOf(runDamaged(place, std::string(length, '\0')));
      const auto selected = device.run({"-p", "tenth"});
      EXPECT_GE(linesOf(selected).size(), found.size()) << place;
      EXPECT_TRUE(selected.ends_with(
          place == 280 ? kStarted : incomplete(name + ": its index contradicts itself")))
          << place;
    }
    // How many entries have a value: it is raised last, and a crash comes before.
    runDamaged(stored.find("_EXE=/usr/bin/tenth") - 16, std::string("\1\0\0", 3));
    fs::rename(file, file.parent_path() / "system@1.journal~");
    EXPECT_EQ(device.run({"-p", "tenth"}), whole);
  }
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
  // Is older than they are, and goes on behind them.
  device.store("a@1.journal", {{now - 99h, {{"MESSAGE", "first"}}}, {now, {{"MESSAGE", "last"}}}});
  EXPECT_EQ(lastWords(device.run({"-p"}, "ulimit -Sn 16;")), "first " + all + "last " + kAll);
  // Half of them are for the files.
  EXPECT_EQ(lastWords(device.run({"-p"}, "ulimit -n 24;")),
            "first " + all.substr(all.find("11 ")) + "last " + kAll +
                "descriptors descriptors descriptors descriptors descriptors 1 ");
#ifndef VELL_SANITIZED  // A sanitizer needs descriptors of its own.
  // Not even the journals can be found. Whoever runs the tests may have left files open.
  EXPECT_EQ(device.run({"-p"}, "rm out.txt; exec 3>&- 4>&- 5>&- 6>&- 7>&-; ulimit -n 5;"),
            "velltool: cannot open a file: Too many open files\nstatus 1\n");
#endif
  // Files that end before the history are not kept open.
  EXPECT_EQ(lastWords(device.run({"-p"}, "H=9000; ulimit -n 24;")), "2 1 last 9000.000000 ");
}

TEST(ExportFailures, WriteAtTheEndOfAFileThatSomebodyEmptied) {
  const DeviceJournal device;
  const auto path = device.root() / "out.txt";
  createEmptyFile(path);
  const auto file = WritableFile::open(path);
  ASSERT_FALSE(file->append("one\n"));
  fs::resize_file(path, 0);
  ASSERT_FALSE(file->append("two\n"));
  EXPECT_EQ(contentOf(path), "two\n");
}

TEST(LiveJournal, IsReadAsFarAsItIsThereAtTheStartAndNotTakenAway) {
  // The last one is what the journal does when it needs room.
  const struct {
    std::string change;
    bool hasAll;         ///< Of the file that is being read.
    std::string behind;  ///< What comes behind that.
  } cases[] = {{"mv $F x; mv system@2.journal y", true, "next last " + kAll},
               {"rm *.journal", true, "last " + kAll + "turn 1 "},
               {"truncate -s 5M $F", false, "next last " + kAll + "page 1 "},
               {"truncate -s 0 $F", false, "next last " + kAll + "page 1 "},
               {"rm $F; fallocate -p -l 20M /dev/fd/3", false, "next last " + kAll + "entry 1 "}};
  DeviceJournal device;
  // Few enough of them are selected for the index to be asked, and so many that they are not all
  // read by the time the export is held up.
  device.store("../../stored/old.journal", entries(2 * kStored, "old", 0, 2));
  device.store("../../stored/system@2.journal", entries(1, "next", 1'000'000));
  device.store("../../stored/user-1.journal", entries(1, "last", 1'000'001));
  std::string whole;
  for (std::size_t count = 0; count < kStored; ++count) {
    whole += "old ";
  }
  for (const std::string name : {"system.journal", "system@1.journal"}) {
    for (const auto& [change, hasAll, behind] : cases) {
      for (const auto& selection : {std::vector{"-p"s}, {"-p", "old", "next", "last"}}) {
        SCOPED_TRACE(name + ", " + change + ", " + selection.back());
        const auto inFolder = "mkdir -p $J; cd $J; F=" + name + "; ";
        device.change(inFolder + "rm -f *; cp ../../stored/* .; mv old.journal $F");
        // It has written its first lines then, and waits for the test to read on.
        auto exporting = device.startExport(selection);
        exporting.readSome();
        device.change(inFolder + "exec 3<>$F; " + change);
        device.store("user-1.journal", entries(1, "last", 1'000'002));
        const auto words = lastWords(device.finish(exporting));
        ASSERT_TRUE(words.ends_with(behind)) << words.substr(words.size() - 50);
        const auto read = words.substr(0, words.size() - behind.size());
        EXPECT_TRUE(whole.starts_with(read));
        EXPECT_EQ(read == whole, hasAll);
      }
    }
  }
}

}  // namespace
