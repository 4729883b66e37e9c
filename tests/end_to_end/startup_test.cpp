// How the tool starts, where its surroundings or its build take more than a session to see.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <chrono>

using namespace std::chrono_literals;

TEST(StartUp, FailsWhenItsShellThreadCannotStart) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "A sanitizer needs an address space without limits.";
#endif
  // A stack that no address space has room for.
  EXPECT_EQ(SimulatedDevice("RADIO_TYPE=1").runLine("ulimit -s 200000000000; exec \"$0\" help"),
            (ProcessResult{1, "",
                           "velltool: cannot start a thread: Resource temporarily unavailable\n"}));
}

TEST(Output, HasEachLineOutBeforeTheNextIsBegun) {
  for (const std::string profile :
       {"TRACE_DUMP_STATE=answer", "TRACE_DUMP_STATE=status:1", "Baseband.TraceEnabled=no"}) {
    SCOPED_TRACE(profile);
    const SimulatedDevice device("RADIO_TYPE=1\nBaseband.TraceEnabled=yes\n" + profile);
    const auto start = std::chrono::steady_clock::now();
    auto tool = device.start({VELLTOOL_PATH, "logdump", "tel", "--", "logdump", "core", "--",
                              "logdump", "bb", "--", "help"});
    tool.readSome("a result");
    // The first half second is the manager's, to tell its state.
    const auto taken = std::chrono::steady_clock::now() - start;
    EXPECT_TRUE(taken >= 500ms && taken < 10s) << taken / 1ms;
    const auto result = tool.finish();
    EXPECT_TRUE(result.status == 0 && tool.wroteEachLineAtOnce()) << result;
  }
}

TEST(StartUp, TakesNoSysrootWithRaisedPrivileges) {
  // That is, in a group that is not the user's own. What id(1) says tells whether that works here.
  const auto* line = R"(cd "$VELL_SYSROOT" && cp "$0" velltool && cp /usr/bin/id id
      ./velltool -- && echo started
      group=$(id -G | tr ' ' '\n' | grep -vx $(id -g) | head -n 1)
      test $(id -u) -ne 0 || group=65534
      chgrp "$group" id velltool && chmod g+s id velltool
      test $(./id -g) = "$group" && test ! -e /etc/vell/device.conf || exit 77
      exec ./velltool --)";
  const auto result = SimulatedDevice("RADIO_TYPE=1\nMANAGER=absent").runLine(line);
  if (result.status == 77) {
    GTEST_SKIP() << "No privileges to be raised here, or the machine itself is a device.";
  }
  EXPECT_EQ(result,
            (ProcessResult{255, "started\n'velltool' is not supported on this product.\n", ""}));
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
                           "NOW PIE", "__stack_chk_fail", "_chk@"}) {
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
