#pragma once

#include "tests/end_to_end/test_process.h"

#include <filesystem>
#include <string>
#include <vector>

/// A simulated device of the test's own, made by vell-simulator, for as long as the object lives.
class SimulatedDevice {
 public:
  /// Starts the device of a profile, given as its text, and waits until all of it can be reached.
  /// It has no journal unless the profile speaks of one.
  /// Throws std::runtime_error with the simulator's words when it does not start.
  explicit SimulatedDevice(const std::string& profile);
  SimulatedDevice(const SimulatedDevice&) = delete;
  SimulatedDevice& operator=(const SimulatedDevice&) = delete;
  ~SimulatedDevice();

  /// The directory that stands for the device's root.
  [[nodiscard]] const std::filesystem::path& root() const { return rootPath; }

  [[nodiscard]] const std::string& busAddress() const { return address; }

  /// The simulator itself, whose input ends the device.
  TestProcess& simulator() { return process; }

  /// Starts a program in the device; `start.environment` need not say which one.
  [[nodiscard]] TestProcess start(ProcessStart start) const;

  /// Starts `velltool` in the device with `words`.
  [[nodiscard]] TestProcess startTool(const std::vector<std::string>& words,
                                      bool onTerminal = false) const;

  /// Runs `velltool` in the device with `words`, feeds it `input` whole, and waits for its end.
  [[nodiscard]] ProcessResult runTool(const std::vector<std::string>& words,
                                      const std::string& input = "") const;

  /// Starts a service (`bus`, `manager`, `helper`) alone in the device and waits until it can be
  /// reached. Each further line of its output is a request that it has received; lines written to
  /// the manager's input change its state. Throws when it does not start.
  [[nodiscard]] TestProcess serve(const std::string& service) const;

  /// The requests that a service of the device, not one started by `serve`, has received so far.
  [[nodiscard]] std::vector<std::string> requests(const std::string& service) const;

  /// What lies in the device's folder of collected logs, sorted.
  [[nodiscard]] std::vector<std::string> collections() const;

 private:
  std::filesystem::path rootPath;
  std::string address;
  TestProcess process;
};

/// The lines of a text, without their newlines.
std::vector<std::string> linesOf(const std::string& text);

/// A file's content; empty when there is none.
std::string contentOf(const std::filesystem::path& path);

/// Starts vell-simulator with `words`.
TestProcess startSimulator(std::vector<std::string> words);

/// A file of the test's own that holds a text, gone with the object.
class TemporaryFile {
 public:
  explicit TemporaryFile(const std::string& text);
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;
  ~TemporaryFile();

  [[nodiscard]] const std::string& path() const { return name; }

 private:
  std::string name;
};
