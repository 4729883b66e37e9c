// The simulator by itself. What it answers is seen by the tests of the tool.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <csignal>

namespace {

ProcessResult runSimulator(const std::vector<std::string>& words) {
  return startSimulator(words).finish();
}

}  // namespace

TEST(Simulator, HasAJournalThatTakesWhatIsLogged) {
  const SimulatedDevice device("RADIO_TYPE=1\nJOURNAL=yes");
  const auto file = device.root() / "out.txt";
  const auto linesWith = [&](const std::vector<std::string>& selection, const std::string& text) {
    std::vector<std::string> words = {"logdump", "oslog", "3600", file.string()};
    words.insert(words.end(), selection.begin(), selection.end());
    EXPECT_EQ(device.runTool(words), (ProcessResult{0, "", ""}));
    const auto lines = linesOf(contentOf(file));
    return std::count_if(lines.begin(), lines.end(), [&](const std::string& line) {
      return line.find(text) != std::string::npos;
    });
  };
  EXPECT_GT(linesWith({}, " Linkward(Linkward):linkward.service [Linkward] cell 310-410"), 3);
  EXPECT_GT(linesWith({}, " haldend(haldend):haldend.service [haldend] modem awake"), 3);
  EXPECT_EQ(linesWith({}, "sshd"), 0);
  EXPECT_GT(linesWith({"-p", "sshd"}, "sshd"), 3);
  // Each export logs what it starts with, which a later one finds.
  while (linesWith({"-p", "velltool"},
                   " velltool(velltool):(null) [velltool] Getting oslog stream: history = "
                   "3600.000000") == 0) {
  }
}

TEST(Simulator, GivesTheStatusOfItsCommand) {
  EXPECT_EQ(runSimulator({"--", "/bin/sh", "-c", "echo out; echo err >&2; exit 7"}),
            (ProcessResult{7, "out\n", "err\n"}));
  EXPECT_EQ(runSimulator({"--", "/bin/sh", "-c", "kill -KILL $$"}),
            (ProcessResult{128 + SIGKILL, "", ""}));
  EXPECT_EQ(
      runSimulator({"--", "/no/such/program"}),
      (ProcessResult{127, "", "vell-simulator: /no/such/program: No such file or directory\n"}));
}

TEST(Simulator, RefusesWhatItCannotRead) {
  const std::string usage =
      "; usage: vell-simulator [PROFILE] [-- COMMAND...] | --serve bus|manager|helper|journal "
      "[LOGFILE]\n";
  const TemporaryFile profile(
      "not a line\nBUS=maybe\nTIMESTAMP=a/b\nTIMESTAMP_TYPE=text\nHELPER_ANSWER=slow:-1\n");
  const auto place = "vell-simulator: " + profile.path();
  const struct {
    std::vector<std::string> words;
    int status;
    std::string errors;
  } cases[] = {
      {{"a", "b"}, 2, "vell-simulator: more than one profile" + usage},
      {{"--help"}, 2, "vell-simulator: \"--help\" is no profile" + usage},
      {{"--"}, 2, "vell-simulator: no command after --" + usage},
      {{"--serve", "x"}, 2, "vell-simulator: no service is called \"x\"" + usage},
      {{"--serve"}, 2, "vell-simulator: --serve takes a service and perhaps a file" + usage},
      {{"--serve", "manager"}, 1, "vell-simulator: --serve works inside a simulated device only\n"},
      {{"/no/file", "--", "/bin/true"}, 1, "vell-simulator: /no/file: No such file or directory\n"},
      {{profile.path(), "--", "/bin/true"},
       1,
       place + ":1: not a KEY=value line\n" + place + ":2: BUS: \"maybe\" is not yes or no\n" +
           place +
           ":4: TIMESTAMP_TYPE: \"text\" is not string, integer, boolean, other, missing or "
           "no-dictionary\n" +
           place + ":3: TIMESTAMP: \"a/b\" is not a part of a file name\n" + place +
           ":5: HELPER_ANSWER: \"slow:-1\" is not made of answer, no-dictionary, wrong-signature, "
           "silent, die, restart, status:NUMBER and slow:MILLISECONDS\n"},
  };
  for (const auto& [words, status, errors] : cases) {
    EXPECT_EQ(runSimulator(words), (ProcessResult{status, "", errors}));
  }
}

TEST(Simulator, WarnsOfMisspeltKeys) {
  const TemporaryFile profile(
      "JOURNAL=no\nTRACE_DUMP_STAT=die\nSERVER_STATE_TYPE=string\nAny.Property=1\n");
  EXPECT_EQ(runSimulator({profile.path(), "--", "/bin/true"}),
            (ProcessResult{0, "",
                           "vell-simulator: " + profile.path() +
                               ":2: TRACE_DUMP_STAT: not a key of the simulator's; it changes "
                               "nothing\n"}));
}

TEST(Simulator, CleansUpHoweverItEnds) {
  for (const int signalNumber : {0, SIGINT, SIGQUIT, SIGTERM, SIGHUP}) {
    SCOPED_TRACE(signalNumber);
    SimulatedDevice device("JOURNAL=yes");
    if (signalNumber != 0) {
      device.simulator().sendSignal(signalNumber);
    }
    const auto result =
        signalNumber == 0 ? device.simulator().finish() : device.simulator().await();
    EXPECT_EQ(result, (ProcessResult{signalNumber == 0 ? 0 : 128 + signalNumber, "", ""}));
    EXPECT_FALSE(std::filesystem::exists(device.root()));
  }
}
