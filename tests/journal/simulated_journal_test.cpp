#include "simulator/journal.h"
#include "tests/end_to_end/test_process.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

namespace {

/// A simulated journal in a process of its own, below a folder that goes with it.
class RunningJournal {
 public:
  RunningJournal() {
    std::string path = std::filesystem::temp_directory_path() / "vell-device-XXXXXX";
    root = mkdtemp(path.data());
    std::array<int, 2> ready{};
    EXPECT_EQ(pipe2(ready.data(), O_CLOEXEC), 0);
    process = fork();
    if (process == 0) {
      const auto now =
          std::chrono::floor<std::chrono::microseconds>(std::chrono::system_clock::now());
      const auto journal = simulator::Journal::create(root, simulator::lastHourOfDevice(now));
      close(ready[1]);
      _exit(journal == nullptr ? 1 : journal->run());
    }
    close(ready[1]);
    char end = 0;
    EXPECT_EQ(read(ready[0], &end, 1), 0);
    close(ready[0]);
  }
  RunningJournal(const RunningJournal&) = delete;
  RunningJournal& operator=(const RunningJournal&) = delete;
  ~RunningJournal() {
    kill(process, SIGKILL);
    waitpid(process, nullptr, 0);
    std::filesystem::remove_all(root);
  }

  /// The lines of an export of the last hour.
  [[nodiscard]] std::vector<std::string> linesOf(const std::vector<std::string>& selection) const {
    const auto output = root / "out.txt";
    ProcessStart start;
    start.words = {OSLOG_EXPORT_PATH, "3600", output};
    start.words.insert(start.words.end(), selection.begin(), selection.end());
    start.environment = {{"VELL_SYSROOT", root}};
    EXPECT_EQ(TestProcess(start).finish(), (ProcessResult{0, "", ""}));
    std::ifstream file(output);
    std::vector<std::string> lines;
    for (std::string line; std::getline(file, line);) {
      lines.push_back(line);
    }
    return lines;
  }

 private:
  std::filesystem::path root;
  pid_t process = -1;
};

TEST(SimulatedJournal, HoldsTheDevicesLogAndWhatIsLoggedToIt) {
  const RunningJournal journal;
  const auto selected = journal.linesOf({});
  const auto count = [&](const std::string& text) {
    return std::count_if(selected.begin(), selected.end(), [&](const std::string& line) {
      return line.find(text) != std::string::npos;
    });
  };
  EXPECT_GT(count(" Linkward(Linkward):linkward.service [Linkward] cell 310-410 chosen"), 3);
  EXPECT_GT(count(" haldend(haldend):haldend.service [haldend] modem awake"), 3);
  EXPECT_EQ(count("sshd") + count("rpmsg"), 0);
  EXPECT_GT(journal.linesOf({"-p", "kernel", "sshd"}).size(), 20U);

  // Each export logs what it starts with, which the next ones find.
  std::vector<std::string> own;
  while (own.empty()) {
    own = journal.linesOf({"-p", "oslog_export"});
  }
  const std::string end =
      " oslog_export(oslog_export):(null) [oslog_export] Getting oslog stream: "
      "history = 3600.000000";
  EXPECT_EQ(own.front().substr(own.front().size() - end.size()), end);
}

TEST(SimulatedJournal, TakesWellFormedMessagesAlone) {
  const auto entry = simulator::fromNativeProtocol(
      std::string("A=1\nB_2\n\x03\0\0\0\0\0\0\0x\ny\n_PID=1\nC=\n", 30));
  ASSERT_TRUE(entry);
  EXPECT_EQ(entry->fields, (std::vector<std::pair<std::string, std::string>>{
                               {"A", "1"}, {"B_2", "x\ny"}, {"C", ""}}));
  EXPECT_NE(
      simulator::toExportFormat(*entry).find(std::string("\nA=1\nB_2\n\x03\0\0\0\0\0\0\0x\ny\n"
                                                         "C=\n\n",
                                                         25)),
      std::string::npos);
  for (const auto& bad : {std::string("A=1"), std::string("=1\n"), std::string("a=1\n"),
                          std::string("A\n\x09\0\0\0\0\0\0\0x\n", 12), std::string("A\nB\n")}) {
    EXPECT_FALSE(simulator::fromNativeProtocol(bad));
  }
}

}  // namespace
