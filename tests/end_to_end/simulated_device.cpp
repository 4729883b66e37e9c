#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

SimulatedDevice::SimulatedDevice(const std::string& profile)
    // It tells where the device is, and holds it until the test ends its input.
    : process({"bash", "-c", R"(exec "$0" <(printf 'JOURNAL=no\n%s\n' "$1") -- sh -c '
                   echo "$VELL_SYSROOT"; echo "$DBUS_SYSTEM_BUS_ADDRESS"; exec cat')",
               VELL_SIMULATOR_PATH, profile}),
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

TestProcess SimulatedDevice::serve(const std::string& service) const {
  auto served = start({VELL_SIMULATOR_PATH, "--serve", service});
  served.readLine();
  return served;
}
