// What the tool writes to the system log, below a sysroot and on the machine itself.

#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <gtest/gtest.h>

#include <chrono>
#include <fstream>

TEST(SystemLog, TakesLongMessagesWholeAndHoldsTheToolUpForASecondInAll) {
  const SimulatedDevice device("MANAGER=absent");
  const auto helpWith = [&](const std::string& line, const std::string& profile) {
    std::ofstream(device.root() / "etc/vell/device.conf") << profile;
    return device.runLine(line).status;
  };
  // In a mount namespace of its own, the machine is the device.
  const auto* onMachine = R"(exec unshare -rm sh -c 'cd "$VELL_SYSROOT" && mount --bind etc /etc &&
      mount --bind run /run && unset VELL_SYSROOT && exec "$0" help' "$0")";
  const std::string value(1'000'000, 'x');
  std::string manyFaults = "RADIO_TYPE=1\nPRODUCT_CODE=58\n";
  for (int times = 0; times < 1000; ++times) {
    manyFaults += "nonsense\n";
  }
  SystemLogSocket log(device.root());
  for (const auto& [line, path] :
       {std::pair(R"(exec "$0" help)", (device.root() / "etc/vell/device.conf").string()),
        {onMachine, "/etc/vell/device.conf"}}) {
    if (line == onMachine && device.runLine("unshare -rm true").status != 0) {
      GTEST_SKIP() << "There is no mount namespace to be had.";
    }
    EXPECT_EQ(helpWith(line, "RADIO_TYPE=" + value), 255);
    EXPECT_EQ(log.messages(),
              std::vector{path + ":1: RADIO_TYPE: '" + value + "' is not an integer"});

    // Nobody takes these away.
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(helpWith(line, manyFaults), 0);
    const auto taken = std::chrono::steady_clock::now() - start;
    EXPECT_GE(taken, std::chrono::seconds(1));
    EXPECT_LT(taken, std::chrono::seconds(10));
    EXPECT_EQ(log.messages().at(1), path + ":4: not a KEY=value line");
  }
}
