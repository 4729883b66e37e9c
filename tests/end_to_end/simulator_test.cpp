// The simulator by itself. What it answers is seen by the tests of the tool.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <csignal>

TEST(Simulator, JournalTakesWhatIsLogged) {
  const SimulatedDevice device("RADIO_TYPE=1\nJOURNAL=yes");
  const auto* line = R"(cd "$VELL_SYSROOT"
      "$0" logdump oslog 3600 out && cut -d' ' -f7 out | LC_ALL=C sort -u | xargs
      "$0" logdump oslog 3600 out -p Linkward sshd && cut -d' ' -f7- out | sort -u
      # Each export logs what it starts with, which a later one finds; who logged it is known of
      # one that had not ended by the time that the journal looked.
      until grep -qs '(velltool)' own; do "$0" logdump oslog 3600 own -p velltool || exit; done
      grep '(velltool)' own | cut -d' ' -f7- | sort -u)";
  const std::string expected =
      "Airgroved(Airgroved):airgroved.service Linkward(Linkward):linkward.service "
      "LinkwardMobileHelper(LinkwardMobileHelper):linkward.service "
      "LinkwardRootHelper(LinkwardRootHelper):linkward.service "
      "Tessfield(Tessfield):tessfield.service "
      "haldend(haldend):haldend.service vell-helper(vell-helper):vell-helper.service "
      "voltkeeperd(voltkeeperd):voltkeeperd.service\n"
      "Linkward(Linkward):linkward.service [Linkward] cell 310-410 chosen\n"
      "Linkward(Linkward):linkward.service [Linkward] registered, roaming off\n"
      "Linkward(Linkward):linkward.service [Linkward] signal -97 dBm\n"
      "sshd(sshd):ssh.service [sshd] connection closed\n"
      "velltool(velltool):(null) [velltool] Getting oslog stream: history = 3600.000000\n";
  EXPECT_EQ(device.runLine(line), (ProcessResult{0, expected, ""}));
}

TEST(Simulator, ExitsWithItsCommandsStatusOrRefusesBadInput) {
  const std::string me = "vell-simulator: ";
  const std::string at = me + "/dev/fd/3:";
  const std::string usage =
      "; usage: vell-simulator [PROFILE] [-- COMMAND...] | --serve bus|manager|helper|journal "
      "[LOGFILE]\n";
  const auto expect = [](const auto* words, const auto* profile, const ProcessResult& result) {
    EXPECT_EQ(startSimulator(words, profile).finish(), result);
  };
  // clang-format off
  expect("-- sh -c 'echo out; echo err >&2; exit 7'", "", {7, "out\n", "err\n"});
  expect("-- sh -c 'kill -KILL $$'", "", {128 + SIGKILL, "", ""});
  expect("-- /no/program", "", {127, "", me + "/no/program: No such file or directory\n"});
  expect("<&- -- cat", "", {0, "", ""});
  expect("a b", "", {2, "", me + "more than one profile" + usage});
  expect("--help", "", {2, "", me + "\"--help\" is no profile" + usage});
  expect("--", "", {2, "", me + "no command after --" + usage});
  expect("--serve x", "", {2, "", me + "no service is called \"x\"" + usage});
  expect("--serve", "", {2, "", me + "--serve takes a service and perhaps a file" + usage});
  expect("--serve manager", "", {1, "", me + "--serve works inside a simulated device only\n"});
  expect("/no/file -- true", "", {1, "", me + "/no/file: No such file or directory\n"});
  expect("/dev/fd/3 -- true",
         "JOURNAL=no\nTRACE_DUMP_STAT=die\nSERVER_STATE_TYPE=string\nAny.Property=1",
         {0, "", at + "2: TRACE_DUMP_STAT: not a key of the simulator's; it changes nothing\n"});
  expect("/dev/fd/3 -- true",
         "not a line\nBUS=maybe\nTIMESTAMP=a/b\nTIMESTAMP_TYPE=text\nHELPER_ANSWER=slow:-1",
         {1, "", at + "1: not a KEY=value line\n" +
          at + "2: BUS: \"maybe\" is not yes or no\n" +
          at + "4: TIMESTAMP_TYPE: \"text\" is not string, integer, boolean, other, "
          "missing or no-dictionary\n" +
          at + "3: TIMESTAMP: \"a/b\" is not a part of a file name\n" +
          at + "5: HELPER_ANSWER: \"slow:-1\" is not made of answer, no-dictionary, "
          "wrong-signature, silent, die, restart, status:NUMBER and slow:MILLISECONDS\n"});
  // clang-format on
}

TEST(Simulator, CleansUpHoweverItEnds) {
  for (const int signalNumber : {0, SIGINT, SIGQUIT, SIGTERM, SIGHUP}) {
    const auto number = std::to_string(signalNumber);
    // What it leaves running would hold its output open.
    // A shell that waits for a program, here a second shell, leaves SIGINT to that.
    const auto line = "sh -c \"setsid sleep 100 & kill -" + number + " $PPID; test " + number +
                      " = 0 || wait\"; :";
    auto simulator =
        startSimulator("/dev/fd/3 -- sh -c 'echo \"$VELL_SYSROOT\"; " + line + "'", "JOURNAL=yes");
    const auto root = simulator.readLine();
    EXPECT_EQ(simulator.finish(),
              (ProcessResult{signalNumber == 0 ? 0 : 128 + signalNumber, "", ""}));
    EXPECT_FALSE(std::filesystem::exists(root));
  }
}
