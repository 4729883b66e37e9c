#pragma once

#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <cstdint>
#include <filesystem>
#include <string>
#include <utility>
#include <vector>

using Fields = std::vector<std::pair<std::string, std::string>>;  ///< Values of any bytes.

/// One entry to be stored.
struct StoredEntry {
  std::uint64_t realtime = 0;  ///< In microseconds.
  Fields fields;
};

/// When the tests start to store: 2021-05-04 13:07:21 UTC, in microseconds.
inline constexpr std::uint64_t kTime = 1'620'133'641'000'000;

/// An entry whose only field, or last one, is its message.
StoredEntry message(std::uint64_t realtime, const std::string& text, Fields fields = {});

/// Entries a microsecond apart. One in `oneIn` is of the program `text`, the others of "other"; the
/// program is the message, too.
std::vector<StoredEntry> entries(std::size_t count, const std::string& text,
                                 std::uint64_t start = kTime, std::size_t oneIn = 1);

/// `entries` in the journal's export format.
std::string exportFormat(const std::vector<StoredEntry>& entries);

/// What an export left behind.
struct Export {
  int status = 0;                     ///< Of the exporting process.
  std::string content;                ///< Of its file; empty when there is none to read.
  std::vector<std::string> messages;  ///< In the system log.
};

/// The messages in `content`, which are single words here, with a blank behind each.
std::string messagesOf(const std::string& content);

/// How often `text` stands in `content`.
std::size_t countOf(const std::string& text, const std::string& content);

/// A history that reaches back to before everything the tests store.
inline const std::string kAllOfHistory = "2147483647";

/// What every export of it that gets as far as the reader tells the system log.
inline const std::string kStarted = "Getting oslog stream: history = " + kAllOfHistory + ".000000";

/// What it tells when something is missing.
inline const std::string kIncomplete = "Invalid oslog stream: reason = 1";

/// A simulated device whose journals the test makes.
class DeviceJournal : public SimulatedDevice {
 public:
  DeviceJournal();

  /// Where the journal files are.
  [[nodiscard]] std::filesystem::path journals() const;

  /// Where `run` has the export write to.
  [[nodiscard]] std::filesystem::path output() const { return root() / "out.txt"; }

  /// Makes the journal file `name` ("system.journal") of `entries`, and rotates it as soon as an
  /// entry of very many fields is in it.
  void store(const std::string& name, const std::vector<StoredEntry>& entries) const;

  /// Starts to store what is written to the process's input, in export format.
  [[nodiscard]] TestProcess startStoring(const std::string& name) const;

  /// Exports with the words `selection`, in UTC. `prelude` is what the shell has in front of the
  /// program: another zone, a limit, what runs it.
  Export run(const std::vector<std::string>& selection = {"-p"}, const std::string& prelude = "",
             const std::string& history = kAllOfHistory);

  /// The messages in the system log since they were last asked for.
  std::vector<std::string> messages() { return systemLog.messages(); }

 private:
  SystemLogSocket systemLog;
};
