#include "tests/end_to_end/simulated_device.h"

#include "simulator/device_model.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <sstream>
#include <utility>

namespace {

/// Tells where the device is, and holds it until the test ends its input.
constexpr const char* kHold =
    R"(printf '%s\n' "$VELL_SYSROOT" "$DBUS_SYSTEM_BUS_ADDRESS"; exec cat)";

}  // namespace

TestProcess startSimulator(std::vector<std::string> words) {
  words.insert(words.begin(), VELL_SIMULATOR_PATH);
  return TestProcess({words, {}, "", false});
}

SimulatedDevice::SimulatedDevice(const std::string& profile)
    : process([&] {
        const bool speaksOfJournal = profile.find("JOURNAL=") != std::string::npos;
        const TemporaryFile file(speaksOfJournal ? profile : profile + "\nJOURNAL=no\n");
        auto simulator = startSimulator({file.path(), "--", "/bin/sh", "-c", kHold});
        rootPath = simulator.readLine();
        address = simulator.readLine();
        return simulator;
      }()) {}

SimulatedDevice::~SimulatedDevice() {
  try {
    if (process.id() > 0) {
      process.finish();
    }
  } catch (const std::exception& error) {
    ADD_FAILURE() << error.what();
  }
}

TestProcess SimulatedDevice::start(ProcessStart start) const {
  start.environment["VELL_SYSROOT"] = rootPath.string();
  start.environment["DBUS_SYSTEM_BUS_ADDRESS"] = address;
  return TestProcess(start);
}

TestProcess SimulatedDevice::startTool(const std::vector<std::string>& words,
                                       bool onTerminal) const {
  ProcessStart tool{{VELLTOOL_PATH}, {}, "velltool", onTerminal};
  tool.words.insert(tool.words.end(), words.begin(), words.end());
  return start(tool);
}

ProcessResult SimulatedDevice::runTool(const std::vector<std::string>& words,
                                       const std::string& input) const {
  auto tool = startTool(words);
  tool.write(input);
  return tool.finish();
}

TestProcess SimulatedDevice::serve(const std::string& service) const {
  auto served = start({{VELL_SIMULATOR_PATH, "--serve", service}, {}, "", false});
  served.readLine();
  return served;
}

std::vector<std::string> SimulatedDevice::requests(const std::string& service) const {
  return linesOf(contentOf(rootPath / "var/log/vell-simulator" / (service + ".log")));
}

std::vector<std::string> SimulatedDevice::collections() const {
  std::vector<std::string> names;
  for (const auto& entry :
       std::filesystem::directory_iterator(rootPath / simulator::kSnapshotDirectory)) {
    names.push_back(entry.path().filename());
  }
  std::sort(names.begin(), names.end());
  return names;
}

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    lines.push_back(line);
  }
  return lines;
}

std::string contentOf(const std::filesystem::path& path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}

TemporaryFile::TemporaryFile(const std::string& text)
    : name((std::filesystem::temp_directory_path() / "velltool-test-XXXXXX").string()) {
  close(mkstemp(name.data()));
  std::ofstream(name, std::ios::binary) << text;
}

TemporaryFile::~TemporaryFile() {
  unlink(name.c_str());
}
