// The simulator by itself. What it answers is seen by the tests of the tool.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <csignal>

TEST(Simulator, HasAJournalThatTakesWhatIsLogged) {
  const SimulatedDevice device("RADIO_TYPE=1\nJOURNAL=yes");
  // What each export logs at its start is found by a later one.
  EXPECT_EQ(
      device.runLine(R"(out=$VELL_SYSROOT/out.txt
      export LC_ALL=C
      "$0" logdump oslog 3600 $out && cut -d' ' -f7- $out | sort -u
      "$0" logdump oslog 3600 $out -p sshd && cut -d' ' -f7- $out | sort -u
      until test -s $out.2; do "$0" logdump oslog 3600 $out.2 -p velltool || exit; done
      cut -d' ' -f7- $out.2 | sort -u)"),
      (ProcessResult{0, R"(Airgroved(Airgroved):airgroved.service [Airgroved] beacon found again
Airgroved(Airgroved):airgroved.service [Airgroved] beacon lost
Linkward(Linkward):linkward.service [Linkward] cell 310-410 chosen
Linkward(Linkward):linkward.service [Linkward] registered, roaming off
Linkward(Linkward):linkward.service [Linkward] signal -97 dBm
LinkwardMobileHelper(LinkwardMobileHelper):linkward.service [LinkwardMobileHelper] carrier settings 42 read
LinkwardRootHelper(LinkwardRootHelper):linkward.service [LinkwardRootHelper] interface pdp0 brought up
Tessfield(Tessfield):tessfield.service [Tessfield] map tile 7/64/42 loaded
haldend(haldend):haldend.service [haldend] modem awake
haldend(haldend):haldend.service [haldend] trace buffer at 12 %
vell-helper(vell-helper):vell-helper.service [vell-helper] timestamp handed out
voltkeeperd(voltkeeperd):voltkeeperd.service [voltkeeperd] battery 81 %
voltkeeperd(voltkeeperd):voltkeeperd.service [voltkeeperd] charging ended
sshd(sshd):ssh.service [sshd] connection closed
velltool(velltool):(null) [velltool] Getting oslog stream: history = 3600.000000
)",
                     ""}));
}

TEST(Simulator, GivesTheStatusOfItsCommandOrRefusesWhatItCannotRead) {
  const std::string me = "vell-simulator: ";
  const std::string usage =
      "; usage: vell-simulator [PROFILE] [-- COMMAND...] | --serve bus|manager|helper|journal "
      "[LOGFILE]\n";
  const std::string place = me + "/dev/fd/3:";
  const std::string bad =
      "not a line\nBUS=maybe\nTIMESTAMP=a/b\nTIMESTAMP_TYPE=text\nHELPER_ANSWER=slow:-1\n";
  const std::string odd =
      "JOURNAL=no\nTRACE_DUMP_STAT=die\nSERVER_STATE_TYPE=string\nAny.Property=1\n";
  const struct {
    std::vector<std::string> words;
    ProcessResult expected;
  } cases[] = {
      // clang-format off
      {{"--", "/bin/sh", "-c", "echo out; echo err >&2; exit 7"}, {7, "out\n", "err\n"}},
      {{"--", "/bin/sh", "-c", "kill -KILL $$"}, {128 + SIGKILL, "", ""}},
      {{"--", "/no/such/program"}, {127, "", me + "/no/such/program: No such file or directory\n"}},
      {{"a", "b"}, {2, "", me + "more than one profile" + usage}},
      {{"--help"}, {2, "", me + "\"--help\" is no profile" + usage}},
      {{"--"}, {2, "", me + "no command after --" + usage}},
      {{"--serve", "x"}, {2, "", me + "no service is called \"x\"" + usage}},
      {{"--serve"}, {2, "", me + "--serve takes a service and perhaps a file" + usage}},
      {{"--serve", "manager"}, {1, "", me + "--serve works inside a simulated device only\n"}},
      {{"/no/file", "--", "true"}, {1, "", me + "/no/file: No such file or directory\n"}},
      // clang-format on
  };
  for (const auto& [words, expected] : cases) {
    EXPECT_EQ(startSimulator(words).finish(), expected);
  }
  const std::vector<std::string> words = {"/dev/fd/3", "--", "true"};
  EXPECT_EQ(startSimulator(words, odd).finish(),
            (ProcessResult{0, "",
                           place + "2: TRACE_DUMP_STAT: not a key of the simulator's; it "
                                   "changes nothing\n"}));
  EXPECT_EQ(
      startSimulator(words, bad).finish(),
      (ProcessResult{1, "",
                     place + "1: not a KEY=value line\n" + place +
                         "2: BUS: \"maybe\" is not yes or no\n" + place +
                         "4: TIMESTAMP_TYPE: \"text\" is not string, integer, boolean, other, "
                         "missing or no-dictionary\n" +
                         place + "3: TIMESTAMP: \"a/b\" is not a part of a file name\n" + place +
                         "5: HELPER_ANSWER: \"slow:-1\" is not made of answer, no-dictionary, "
                         "wrong-signature, silent, die, restart, status:NUMBER and "
                         "slow:MILLISECONDS\n"}));
}

TEST(Simulator, CleansUpHoweverItEnds) {
  for (const int signalNumber : {0, SIGINT, SIGQUIT, SIGTERM, SIGHUP}) {
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
