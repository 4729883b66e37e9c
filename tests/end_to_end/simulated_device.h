#pragma once

#include "tests/end_to_end/test_process.h"

#include <array>
#include <atomic>
#include <cstddef>
#include <filesystem>
#include <future>
#include <iterator>
#include <string>
#include <vector>

/// The tool's prompt at its root.
inline const std::string kPrompt = "(/velltool)>> ";

/// What the line starts with that names a collection.
inline const std::string kCollectionPath =
    "Path = /private/var/wireless/Library/Logs/Faultkeeper/Baseband/";

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

  /// Runs `velltool` in the device with `words`, which the shell splits, and waits for its end.
  /// Fails the test when a line was not written before the next one was begun.
  [[nodiscard]] ProcessResult runTool(const std::string& words) const;

  /// Starts a service (`bus`, `manager`, `helper`) alone in the device and waits until it can be
  /// reached. Each further line of its output is a request that it has received; lines written to
  /// the manager's input change its state. Throws when it does not start.
  [[nodiscard]] TestProcess serve(const std::string& service) const;

  /// The lines of the requests that the manager of the device has carried out so far, and of those
  /// that its helper has, unless `serve` has started them.
  [[nodiscard]] std::string requests() const;

  /// What lies in the device's folder of collected logs: a line each, sorted.
  [[nodiscard]] std::string collections() const;

 private:
  TestProcess process;
  std::filesystem::path rootPath;
  std::string address;
};

/// Starts vell-simulator with `words`, which the shell splits; /dev/fd/3 holds `profile`.
TestProcess startSimulator(const std::string& words, const std::string& profile);

/// Calls `check` with each of `rows`, four at a time: a device takes half a second to start. Throws
/// what a call throws.
template <typename Rows, typename Check>
void forEachAtOnce(const Rows& rows, const Check& check) {
  std::atomic<std::size_t> next = 0;
  const auto checkRows = [&] {
    for (std::size_t row = 0; (row = next++) < std::size(rows);) {
      check(rows[row]);
    }
  };
  std::array<std::future<void>, 4> threads;
  for (auto& thread : threads) {
    thread = std::async(std::launch::async, checkRows);
  }
  for (auto& thread : threads) {
    thread.get();
  }
}
