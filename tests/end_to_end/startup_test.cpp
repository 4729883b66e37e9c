// How the tool starts, where its surroundings or its build take more than a session to see.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

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
#ifndef VELL_HARDENED
  GTEST_SKIP() << "Built to be looked into.";
#endif
  const auto* line = R"(readelf --wide --file-header --segments --dynamic "$0"
      nm --dynamic "$0"
      objdump --disassemble "$0" | sed -n 's/or[ql]  *[$]0x0,.*%rsp.*/probed stack/p')";
  const auto output = TestProcess({"sh", "-c", line, VELLTOOL_PATH}).finish().output;
  const char* const parts[] = {
#if defined __x86_64__ && !defined __clang__
    // In C++, clang fortifies nothing of what the tool calls; other machines probe otherwise.
    "_chk@",
    "probed stack",
#endif
    "DYN (Position-Independent Executable",
    "GNU_RELRO",
    "BIND_NOW",
    "NOW PIE",
    "__stack_chk_fail"
  };
  for (const auto* part : parts) {
    EXPECT_NE(output.find(part), std::string::npos) << part;
  }
}
