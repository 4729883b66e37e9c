#pragma once

#include "tests/end_to_end/test_process.h"

#include <filesystem>
#include <string>
#include <vector>

/// The tool's prompt at its root.
inline const std::string kPrompt = "(/velltool)>> ";

/// A simulated device of the test's own, made by vell-simulator, for as long as the object lives.
class SimulatedDevice {
 public:
  /// Starts the device of a profile, given as its text, and waits until all of it can be reached.
  /// It has no journal unless the profile says that it has.
  /// Throws std::runtime_error with the simulator's words when it does not start.
  explicit SimulatedDevice(const std::string& profile);
  SimulatedDevice(const SimulatedDevice&) = delete;
  SimulatedDevice& operator=(const SimulatedDevice&) = delete;
  ~SimulatedDevice();

  /// The directory that stands for the device's root.
  [[nodiscard]] const std::filesystem::path& root() const { return rootPath; }

  [[nodiscard]] const std::string& busAddress() const { return address; }

  /// Starts `words`, as a TestProcess takes them, in the device.
  [[nodiscard]] TestProcess start(std::vector<std::string> words) const;

  /// Runs `line` with the shell in the device and waits for its end: $0 is `velltool`, the other
  /// parameters are `words`.
  [[nodiscard]] ProcessResult runLine(const std::string& line,
                                      std::vector<std::string> words = {}) const;

  /// Starts a service (`bus`, `manager`, `helper`) alone in the device and waits until it can be
  /// reached. Each further line of its output is a request that it has received; lines written to
  /// the manager's input change its state. Throws when it does not start.
  [[nodiscard]] TestProcess serve(const std::string& service) const;

 private:
  TestProcess process;
  std::filesystem::path rootPath;
  std::string address;
};
