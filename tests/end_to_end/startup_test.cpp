// How the tool starts, and when it refuses to.

#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"
#include "tests/help_text.h"

#include <gtest/gtest.h>

#include <fstream>

namespace {

std::string rootHelp(const std::string& name) {
  return helpText(name, "\t         logdump  -  [bb|core|oslog|tel]\n\n");
}

const ProcessResult kNoRadio = {255, "'velltool' is not supported on this product.\n", ""};
const ProcessResult kNoDaemon = {
    255,
    "Linkward process is not running. Please run/load Linkward (or modemhostd) and try again.\n",
    ""};
const ProcessResult kStarted = {0, rootHelp("velltool"), ""};

}  // namespace

TEST(StartUp, RefusesWithoutRadioOrDaemon) {
  const std::pair<const char*, ProcessResult> cases[] = {
      {"", kNoRadio},
      {"RADIO_TYPE=0\nPRODUCT_CODE=58", kNoRadio},
      {"RADIO_TYPE=-1", kStarted},
      {"RADIO_TYPE=1\nPROCESSES=", kNoDaemon},
      {"RADIO_TYPE=1\nPROCESSES='linkward Linkwardx modemhost'", kNoDaemon},
      {"RADIO_TYPE=1\nPROCESSES=Linkward", kStarted},
      {"RADIO_TYPE=1\nPROCESSES='init modemhostd'", kStarted},
      {"RADIO_TYPE=1\nPROCESSES=\nPRODUCT_CODE=106", kStarted}};
  for (const auto& [profile, expected] : cases) {
    SCOPED_TRACE(profile);
    const SimulatedDevice device(std::string("MANAGER=absent\n") + profile);
    EXPECT_EQ(device.runTool("help"), expected);
    if (expected == kNoDaemon) {
      // A process may be known by its executable alone.
      const auto* line =
          R"(cd "$VELL_SYSROOT/proc"; mkdir 31; ln -s /opt/Linkward 31/exe; "$0" help)";
      EXPECT_EQ(device.runLine(line), kStarted);
    }
  }
}

TEST(StartUp, TakesItsNameFromTheCommandLine) {
  const SimulatedDevice device("RADIO_TYPE=1");
  for (const auto& [name, shown] :
       {std::pair{"mytool", "mytool"}, {"/usr/bin/my tool", "my tool"}, {"", "velltool"}}) {
    EXPECT_EQ(device.runLine("exec -a \"$1\" \"$0\" help", {name}),
              (ProcessResult{0, rootHelp(shown), ""}));
  }
  const std::string greeting = "OpenClient \"velltool\"\n";
  EXPECT_EQ(contentOf(device.root() / "var/log/vell-simulator/manager.log"),
            greeting + greeting + greeting);
}

TEST(StartUp, ReadsCommandsFromPipeOrTerminal) {
  const SimulatedDevice device("RADIO_TYPE=1\nTIMESTAMP=T");
  EXPECT_EQ(device.runTool("<<< quit"), (ProcessResult{0, kPrompt, ""}));
  EXPECT_EQ(device.runTool("< <(printf 'cd logdump\\nback\\nhelp')"),
            (ProcessResult{
                1, kPrompt + "(/velltool/logdump)>> " + kPrompt + kStarted.output + kPrompt, ""}));

  auto onTerminal = device.start(
      {"TERM=dumb", "script", "-qec", std::string("'") + VELLTOOL_PATH + "'", "/dev/null"});
  // The prompt is there before anything is typed; the terminal shows what is typed.
  EXPECT_EQ(onTerminal.readUntil(">> "), kPrompt);
  onTerminal.write("logdump tel\n");
  EXPECT_EQ(onTerminal.readUntil(">> "),
            "logdump tel\r\nTelephony log collection: Success\r\nPath = "
            "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T-*\r\n" +
                kPrompt);
  EXPECT_EQ(onTerminal.finish().status, 1);
}

TEST(StartUp, ReportsProfileFaultsAndGoesOn) {
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent");
  SystemLogSocket log(device.root());
  const std::string profile = device.root() / "etc/vell/device.conf";
  std::ofstream(profile) << "RADIO_TYPE=1\nPRODUCT_CODE=many\n\nnonsense\nINTERNAL_BUILD='yes\n";
  EXPECT_EQ(device.runTool("help"), kStarted);
  EXPECT_EQ(log.messages(),
            (std::vector{profile + ":4: not a KEY=value line",
                         profile + ":5: INTERNAL_BUILD: value is not quoted as it must be",
                         profile + ":2: PRODUCT_CODE: 'many' is not an integer"}));

  // What is no file is not waited for.
  EXPECT_EQ(device.runLine("rm \"$1\"; mkfifo \"$1\"; exec \"$0\" help", {profile}), kNoRadio);
  EXPECT_EQ(log.messages(), std::vector{profile + ": not a file"});
}

TEST(StartUp, FailsWhenItsShellThreadCannotStart) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "A sanitizer needs an address space without limits.";
#endif
  // A stack that no address space has room for.
  EXPECT_EQ(SimulatedDevice("RADIO_TYPE=1").runLine("ulimit -s 200000000000; exec \"$0\" help"),
            (ProcessResult{1, "",
                           "velltool: cannot start the shell thread: Resource temporarily "
                           "unavailable\n"}));
}

TEST(StartUp, KeepsClosedStreamsFree) {
  const SimulatedDevice device("RADIO_TYPE=1");
  for (const std::string closed : {">&-", "<&-", "2>&-"}) {
    EXPECT_EQ(device.runTool("help " + closed).status, 0) << closed;
  }
  auto tool = device.start({"sh", "-c", "echo $$; exec \"$0\" 2>&-", VELLTOOL_PATH});
  const auto process = "/proc/" + tool.readLine();
  tool.readUntil(kPrompt);
  EXPECT_EQ(std::filesystem::read_symlink(process + "/fd/2"), "/dev/null");
}

TEST(Output, WaitsForRoomWhereItDoesNotBlock) {
  // Both streams go to a pipe that is emptied byte by byte, and so is full most of the time.
  const auto* line = R"(yes logdump tel | head -n 3000 |
      perl -e 'use Fcntl; fcntl STDOUT, F_SETFL, O_WRONLY | O_NONBLOCK; exec @ARGV' "$0" 2>&1 |
      dd bs=1 status=none)";
  std::string expected;
  for (int times = 0; times < 3000; ++times) {
    expected += kPrompt + "Server is not running. Please try after server starts.\n";
  }
  EXPECT_EQ(SimulatedDevice("RADIO_TYPE=1\nMANAGER=absent").runLine(line).output,
            expected + kPrompt);
}

TEST(Output, EndsTheRunWhenItIsLost) {
  const SimulatedDevice device("RADIO_TYPE=1");
  const ProcessResult lost = {1, "", "velltool: cannot write to standard output\n"};
  EXPECT_EQ(device.runTool(">/dev/full <<< 'logdump tel'"), lost);
  EXPECT_EQ(device.requests(), "");
  EXPECT_EQ(device.runTool("logdump bb -- logdump tel >/dev/full"), lost);
  EXPECT_EQ(device.requests().find("SystemLogs"), std::string::npos);
}

TEST(StartUp, TakesNoSysrootWithRaisedPrivileges) {
  // That is, in a group that is not the user's own. What id(1) says tells whether that works here.
  const auto* line = R"(cd "$VELL_SYSROOT" && cp "$0" velltool && cp /usr/bin/id id
      ./velltool help
      group=$(id -G | tr ' ' '\n' | grep -vx $(id -g) | head -n 1)
      test $(id -u) -ne 0 || group=65534
      chgrp "$group" id velltool && chmod g+s id velltool
      test $(./id -g) = "$group" && test ! -e /etc/vell/device.conf || exit 77
      exec ./velltool help)";
  const auto result = SimulatedDevice("RADIO_TYPE=1\nMANAGER=absent").runLine(line);
  if (result.status == 77) {
    GTEST_SKIP() << "No privileges to be raised here, or the machine itself is a device.";
  }
  EXPECT_EQ(result, (ProcessResult{255, kStarted.output + kNoRadio.output, ""}));
}

TEST(StartUp, IsBuiltToBeAttacked) {
#if defined VELL_SANITIZED || !defined __OPTIMIZE__
  GTEST_SKIP() << "Built to be looked into.";
#endif
  const auto* line = R"(readelf --wide --file-header --segments --dynamic "$0"
      nm --dynamic "$0"
      objdump --disassemble "$0" | sed -n 's/or[ql]  *[$]0x0,.*%rsp.*/probed stack/p')";
  const auto output = TestProcess({"sh", "-c", line, VELLTOOL_PATH}).finish().output;
  for (const auto* part : {"DYN (Position-Independent Executable", "GNU_RELRO", "BIND_NOW",
                           "NOW PIE", "__stack_chk_fail", "printf_chk@"}) {
    EXPECT_NE(output.find(part), std::string::npos) << part;
  }
#if defined __x86_64__ && !defined __clang__
  EXPECT_NE(output.find("probed stack"), std::string::npos);
#endif
}

TEST(StartUp, ExportsItsInterfaceAndNothingElse) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "A sanitizer has the linker export everything.";
#endif
  // Without arguments and without what belongs to others; of the classes, what stands for all.
  const auto* line = R"(nm --dynamic --defined-only --demangle "$0" | cut -c 20- |
      sed -E '/^typeinfo|^_|@|^std::|^[^(]* std::/d; s/[[(].*//; s/(Command(Base|Shell)?)::.*/\1/
              s/vtable for (.*)/\1.vtable/' |
      LC_ALL=C sort -u | xargs)";
  EXPECT_EQ(TestProcess({"sh", "-c", line, VELLTOOL_PATH}).finish().output,
            "CommandBase CommandBase.vtable CommandShell CommandShell.vtable GetOsLogContext "
            "IsServerRunning LogdumpCommand LogdumpCommand.vtable VellCommand VellCommand.vtable "
            "VellCommandBase VellCommandBase.vtable config::build::internal_or_carrier "
            "config::hw::watch diag::config::kDIAGScratchDir diag::config::kQDSSScratchDir "
            "kServerDownErrorPrint vell::trace::getBasebandTraceDirSuffix "
            "vell::trace::getCoreDumpDirSuffix vell::trace::kAlderCoreDumpSnapshotDirectorySuffix "
            "vell::trace::kAlderTraceSnapshotDirectorySuffix "
            "vell::trace::kBirchCoreDumpSnapshotDirectorySuffix "
            "vell::trace::kBirchQDSSTraceSnapshotDirectorySuffix "
            "vell::trace::kBirchTraceSnapshotDirectorySuffix vell::trace::kLogDirPrefix "
            "vell::trace::kLogTarExtension vell::trace::kLogTarGzExtension "
            "vell::trace::kScratchFolder vell::trace::kSnapshotFolder\n");
}
