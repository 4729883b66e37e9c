#include "tests/end_to_end/simulated_device.h"

#include "simulator/device_model.h"

#include <gtest/gtest.h>

TestProcess startSimulator(const std::string& words, const std::string& profile) {
  const auto line = "exec \"$0\" " + words + " 3<<END\n$1\nEND";
  return TestProcess({"sh", "-c", line, VELL_SIMULATOR_PATH, profile});
}

SimulatedDevice::SimulatedDevice(const std::string& profile)
    // It tells where the device is, and holds it until the test ends its input.
    : process(startSimulator(
          R"(/dev/fd/3 -- sh -c 'echo "$VELL_SYSROOT"; echo "$DBUS_SYSTEM_BUS_ADDRESS"; exec cat')",
          "JOURNAL=no\n" + profile)),
      rootPath(process.readLine()),
      address(process.readLine()) {}

SimulatedDevice::~SimulatedDevice() {
  EXPECT_NO_THROW(process.finish());
}

TestProcess SimulatedDevice::start(std::vector<std::string> words) const {
  words.insert(words.begin(),
               {"VELL_SYSROOT=" + rootPath.string(), "DBUS_SYSTEM_BUS_ADDRESS=" + address});
  return TestProcess(std::move(words));
}

ProcessResult SimulatedDevice::runLine(const std::string& line,
                                       std::vector<std::string> words) const {
  words.insert(words.begin(), {"bash", "-c", line, VELLTOOL_PATH});
  return start(words).finish();
}

ProcessResult SimulatedDevice::runTool(const std::string& words) const {
  auto tool = start({"bash", "-c", "exec \"$0\" " + words, VELLTOOL_PATH});
  auto result = tool.finish();
  EXPECT_TRUE(tool.wroteEachLineAtOnce()) << result;
  return result;
}

TestProcess SimulatedDevice::serve(const std::string& service) const {
  auto served = start({VELL_SIMULATOR_PATH, "--serve", service});
  served.readLine();
  return served;
}

std::string SimulatedDevice::requests() const {
  const auto* line = R"(cd "$VELL_SYSROOT/var/log/vell-simulator"; cat manager.log helper.log)";
  return runLine(line + std::string(" | grep ^Perform")).output;
}

std::string SimulatedDevice::collections() const {
  return start({"ls", rootPath / simulator::kSnapshotDirectory}).finish().output;
}
