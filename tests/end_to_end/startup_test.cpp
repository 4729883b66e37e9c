// How the tool starts, and when it refuses to.

#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <fstream>

namespace {

std::string rootHelp(const std::string& name) {
  return "\nOptions for command '\x1b[32m" + name +
         "\x1b[39m':\n\n"
         "\t         logdump  -  [bb|core|oslog|tel]\n\n"
         "\t              cd  -  <sub-command>\n"
         "\t            help\n"
         "\t            back\n"
         "\t            quit\n\n";
}

const ProcessResult kNoRadio = {255, "'velltool' is not supported on this product.\n", ""};
const ProcessResult kNoDaemon = {
    255,
    "Linkward process is not running. Please run/load Linkward (or modemhostd) and try again.\n",
    ""};
const ProcessResult kStarted = {0, rootHelp("velltool"), ""};

/// What nm(1) lists as defined in the dynamic symbol table, without what belongs to others.
std::vector<std::string> exportedSymbols() {
  const auto listed =
      TestProcess({{"/bin/sh", "-c", "nm --dynamic --defined-only --demangle --format=posix \"$0\"",
                    VELLTOOL_PATH},
                   {},
                   "",
                   false})
          .finish();
  std::vector<std::string> symbols;
  for (auto line : linesOf(listed.output)) {
    line = line.substr(0, line.find('('));
    const bool foreign = line.find("std::") != std::string::npos ||
                         line.find('@') != std::string::npos || line.starts_with("__");
    if (!foreign) {
      symbols.push_back(line.substr(0, line.find(" V ")).substr(0, line.find(" D ")));
    }
  }
  std::sort(symbols.begin(), symbols.end());
  symbols.erase(std::unique(symbols.begin(), symbols.end()), symbols.end());
  return symbols;
}

}  // namespace

TEST(StartUp, NeedsARadioAndADaemon) {
  const struct {
    std::string profile;
    ProcessResult expected;
  } cases[] = {
      {"RADIO_TYPE=0", kNoRadio},
      {"", kNoRadio},
      {"RADIO_TYPE=0\nPRODUCT_CODE=58", kNoRadio},
      {"RADIO_TYPE=-1", kStarted},
      {"RADIO_TYPE=1\nPROCESSES=", kNoDaemon},
      {"RADIO_TYPE=1\nPROCESSES=\"linkward Linkwardx modemhost\"", kNoDaemon},
      {"RADIO_TYPE=1\nPROCESSES=Linkward", kStarted},
      {"RADIO_TYPE=1\nPROCESSES=\"init modemhostd\"", kStarted},
      {"RADIO_TYPE=1\nPROCESSES=\nPRODUCT_CODE=106", kStarted},
      {"RADIO_TYPE=1\nPROCESSES=\nPRODUCT_CODE=107", kNoDaemon},
  };
  for (const auto& [profile, expected] : cases) {
    SCOPED_TRACE(profile);
    EXPECT_EQ(SimulatedDevice("MANAGER=absent\n" + profile).runTool({"help"}), expected);
  }
}

TEST(StartUp, FindsADaemonByItsExecutableAlone) {
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent\nPROCESSES=other");
  const auto process = device.root() / "proc/31337";
  std::filesystem::create_directories(process);
  EXPECT_EQ(device.runTool({"help"}), kNoDaemon);
  std::filesystem::create_symlink("/opt/Linkward", process / "exe");
  EXPECT_EQ(device.runTool({"help"}), kStarted);
}

TEST(StartUp, TakesItsNameFromTheCommandLine) {
  const SimulatedDevice device("RADIO_TYPE=1");
  for (const auto& [name, shown] :
       {std::pair{"mytool", "mytool"}, {"/usr/bin/my tool", "my tool"}, {"", "velltool"}}) {
    auto tool = device.start(
        {{"/bin/bash", "-c", R"(exec -a "$1" "$0" help)", VELLTOOL_PATH, name}, {}, "", false});
    EXPECT_EQ(tool.finish(), (ProcessResult{0, rootHelp(shown), ""}));
  }
  EXPECT_EQ(device.requests("manager"), std::vector<std::string>(3, "OpenClient \"velltool\""));
}

TEST(StartUp, ReadsCommandsFromAPipe) {
  const SimulatedDevice device("RADIO_TYPE=1");
  EXPECT_EQ(device.runTool({}, "quit\n"), (ProcessResult{0, "(/velltool)>> ", ""}));
  EXPECT_EQ(device.runTool({}, ""), (ProcessResult{1, "(/velltool)>> ", ""}));
  EXPECT_EQ(device.runTool({}, "cd logdump\nback\nhelp"),
            (ProcessResult{1,
                           "(/velltool)>> (/velltool/logdump)>> (/velltool)>> " +
                               rootHelp("velltool") + "(/velltool)>> ",
                           ""}));
}

TEST(StartUp, ReadsCommandsFromATerminal) {
  const SimulatedDevice device("RADIO_TYPE=1\nTIMESTAMP=T");
  auto tool = device.startTool({}, true);
  // The prompt is there before anything is typed; the terminal shows what is typed.
  EXPECT_EQ(tool.readUntil("(/velltool)>> "), "(/velltool)>> ");
  tool.write("cd logdump\n");
  EXPECT_EQ(tool.readUntil(")>> "), "cd logdump\r\n(/velltool/logdump)>> ");
  tool.write("tel\n");
  EXPECT_EQ(tool.readUntil(")>> "),
            "tel\r\nTelephony log collection: Success\r\nPath = "
            "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T-*\r\n"
            "(/velltool/logdump)>> ");
  tool.write("exit\n");
  EXPECT_EQ(tool.finish().status, 0);

  auto abandoned = device.startTool({}, true);
  EXPECT_EQ(abandoned.readUntil(")>> "), "(/velltool)>> ");
  EXPECT_EQ(abandoned.finish().status, 1);
}

TEST(StartUp, ReportsWhatIsWrongWithTheProfileAndGoesOn) {
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent\nJOURNAL=no");
  SystemLogSocket log(device.root());
  const auto profile = device.root() / "etc/vell/device.conf";
  std::ofstream(profile) << "RADIO_TYPE=1\nPRODUCT_CODE=many\n\nnonsense\nINTERNAL_BUILD='yes\n";
  EXPECT_EQ(device.runTool({"help"}), kStarted);
  EXPECT_EQ(log.messages(),
            (std::vector<std::string>{
                profile.string() + ":4: not a KEY=value line",
                profile.string() + ":5: INTERNAL_BUILD: value is not quoted as it must be",
                profile.string() + ":2: PRODUCT_CODE: 'many' is not an integer"}));

  // More than the socket takes while nobody reads from it.
  std::ofstream many(profile, std::ios::app);
  for (int line = 0; line < 1000; ++line) {
    many << "nonsense\n";
  }
  many.close();
  EXPECT_EQ(device.runTool({"help"}), kStarted);
  static_cast<void>(log.messages());

  // What is no file is not waited for.
  std::filesystem::remove(profile);
  ASSERT_EQ(mkfifo(profile.c_str(), 0600), 0);
  EXPECT_EQ(device.runTool({"help"}), kNoRadio);
  EXPECT_EQ(log.messages(), std::vector<std::string>{profile.string() + ": not a file"});
}

TEST(StartUp, SaysWhyTheShellThreadCannotBeStarted) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "A sanitizer needs an address space without limits.";
#endif
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent");
  // A stack that no address space has room for.
  const auto* const line = "ulimit -s 200000000000 && exec \"$0\" help";
  EXPECT_EQ(device.start({{"/bin/sh", "-c", line, VELLTOOL_PATH}, {}, "", false}).finish(),
            (ProcessResult{1, "",
                           "velltool: cannot start the shell thread: Resource temporarily "
                           "unavailable\n"}));
}

TEST(StartUp, KeepsClosedStreamsFree) {
  const SimulatedDevice device("RADIO_TYPE=1\nJOURNAL=yes");
  const auto file = device.root() / "export.txt";
  for (const auto* closed : {">&-", "<&-", "2>&-", ">/dev/full"}) {
    SCOPED_TRACE(closed);
    const std::string line =
        "exec \"$0\" logdump oslog 3600 \"$1\" -- logdump oslog -- help " + std::string(closed);
    EXPECT_EQ(device.start({{"/bin/sh", "-c", line, VELLTOOL_PATH, file.string()}, {}, "", false})
                  .finish()
                  .status,
              1);
    const auto exported = contentOf(file);
    EXPECT_NE(exported, "");
    EXPECT_EQ(exported.find("Failed"), std::string::npos);
  }
}

TEST(StartUp, ExportsItsInterfaceAndNothingElse) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "A sanitizer has the linker export everything.";
#endif
  const auto symbols = exportedSymbols();
  for (const auto* name : {"IsServerRunning",
                           "GetOsLogContext",
                           "kServerDownErrorPrint",
                           "config::hw::watch",
                           "config::build::internal_or_carrier",
                           "vell::trace::kSnapshotFolder",
                           "vell::trace::kLogDirPrefix",
                           "vell::trace::kLogTarExtension",
                           "vell::trace::kLogTarGzExtension",
                           "vell::trace::kScratchFolder",
                           "vell::trace::kAlderTraceSnapshotDirectorySuffix",
                           "vell::trace::kBirchTraceSnapshotDirectorySuffix",
                           "vell::trace::kBirchQDSSTraceSnapshotDirectorySuffix",
                           "vell::trace::kAlderCoreDumpSnapshotDirectorySuffix",
                           "vell::trace::kBirchCoreDumpSnapshotDirectorySuffix",
                           "diag::config::kDIAGScratchDir",
                           "diag::config::kQDSSScratchDir",
                           "vell::trace::getBasebandTraceDirSuffix[abi:cxx11]",
                           "vell::trace::getCoreDumpDirSuffix[abi:cxx11]",
                           "CommandBase::execCommand",
                           "CommandShell::run",
                           "VellCommandBase::VellCommandBase",
                           "VellCommand::create",
                           "LogdumpCommand::isAllowed",
                           "vtable for LogdumpCommand"}) {
    EXPECT_TRUE(std::binary_search(symbols.begin(), symbols.end(), name)) << name;
  }
  for (const auto& symbol : symbols) {
    const bool wanted = symbol == "IsServerRunning" || symbol == "GetOsLogContext" ||
                        symbol == "kServerDownErrorPrint" || symbol.starts_with("config::") ||
                        symbol.starts_with("vell::trace::") ||
                        symbol.starts_with("diag::config::") ||
                        symbol.find("CommandBase") != std::string::npos ||
                        symbol.find("CommandShell") != std::string::npos ||
                        symbol.find("VellCommand") != std::string::npos ||
                        symbol.find("LogdumpCommand") != std::string::npos;
    EXPECT_TRUE(wanted) << symbol;
  }
}
