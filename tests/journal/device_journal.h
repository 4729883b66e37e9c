#pragma once

#include "platform/clock.h"
#include "simulator/journal_entry.h"
#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

using Fields = std::vector<std::pair<std::string, std::string>>;  ///< Values of any bytes.
using StoredEntries = std::vector<simulator::JournalEntry>;

/// Where the tests count from: 2021-05-04 13:07:21 UTC.
inline constexpr LogTime kTime{std::chrono::microseconds(1'620'133'641'000'000)};

/// An entry that is stored some microseconds after kTime. Its last field is its message.
simulator::JournalEntry message(long after, const std::string& text, Fields fields = {});

/// Entries a microsecond apart. One in `oneIn` is of the program `text`, the others of "other"; the
/// program is the message, too.
StoredEntries entries(std::size_t count, const std::string& text, std::size_t after = 0,
                      std::size_t oneIn = 1);

/// `entries` in the journal's export format.
std::string exportFormat(const StoredEntries& entries);

/// The messages in `content`, which are single words here, with a blank behind each.
std::string messagesOf(const std::string& content);

/// How often `text` stands in `content`.
std::size_t countOf(const std::string& text, const std::string& content);

/// A history that reaches back to before everything the tests store.
inline const std::string kAllOfHistory = "2147483647";

/// What an export of it tells the system log when it gets as far as the reader.
inline const std::vector kStarted = {"Getting oslog stream: history = " + kAllOfHistory +
                                     ".000000"};

/// What it tells when something is missing besides.
inline const std::vector<std::string> kIncomplete = {kStarted[0],
                                                     "Invalid oslog stream: reason = 1"};

/// What an export left behind.
struct Export {
  int status = 0;                                ///< Of the exporting process.
  std::string content = {};                      ///< Of its file; empty when there is none to read.
  std::vector<std::string> messages = kStarted;  ///< In the system log.

  friend bool operator==(const Export&, const Export&) = default;
  friend std::ostream& operator<<(std::ostream& stream, const Export& result) {
    return stream << result.status << "\n"
                  << result.content.substr(0, 5000) << testing::PrintToString(result.messages);
  }
};

/// A simulated device whose journals the test makes.
class DeviceJournal : public SimulatedDevice {
 public:
  DeviceJournal();

  /// Where the journal files are.
  [[nodiscard]] std::filesystem::path journals() const;

  /// Where `run` has the export write to.
  [[nodiscard]] std::filesystem::path output() const { return root() / "out.txt"; }

  /// Makes the journal file `name` of `entries`. Rotates it behind an entry of very many fields.
  void store(const std::string& name, const StoredEntries& entries) const;

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
