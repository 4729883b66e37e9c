#pragma once

#include "platform/clock.h"
#include "simulator/journal.h"
#include "simulator/journal_entry.h"
#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <filesystem>
#include <string>
#include <utility>
#include <vector>

using Fields = std::vector<std::pair<std::string, std::string>>;  ///< Values of any bytes.
using StoredEntries = std::vector<simulator::JournalEntry>;

/// Where the tests count from: 2021-05-04 13:07:21 UTC.
inline constexpr LogTime kTime{std::chrono::microseconds(1'620'133'641'000'000)};

/// Where the journal files are, below the root.
inline const auto kJournals = std::filesystem::path(simulator::kJournalFile).parent_path();

/// An entry that is stored some microseconds after kTime. Its last field is its message.
simulator::JournalEntry message(long after, const std::string& text, Fields fields = {});

/// Entries a microsecond apart. One in `oneIn` is of the program `text`, which is its message, too;
/// the others are of "other", and without a message.
StoredEntries entries(std::size_t count, const std::string& text, std::size_t after = 0,
                      std::size_t oneIn = 1);

/// The last word of each line in `text`, with a blank behind it: a message that is one word.
std::string lastWords(const std::string& text);

/// What an export of the whole history tells the system log when it gets as far as the reader.
inline const std::string kStarted = "Getting oslog stream: history = 2147483647.000000\n";

/// The last word of it, see `lastWords`.
inline const std::string kAll = "2147483647.000000 ";

/// What it tells when entries of a file are missing, with the cause.
inline std::string incomplete(const std::string& damage) {
  return kStarted + damage + "\nInvalid oslog stream: reason = 1\n";
}

/// A simulated device whose journals the test makes.
class DeviceJournal : public SimulatedDevice {
 public:
  DeviceJournal() : SimulatedDevice("BUS=no"), systemLog(root()) {}

  /// Adds `entries` to the journal file `name`. Rotates it behind an entry of very many fields.
  void store(const std::string& name, const StoredEntries& entries) const;

  /// Runs a line of the shell in the root, and returns its output. $J is where the journal files
  /// are. Fails the test when the line complains.
  std::string change(const std::string& line);

  /// Starts an export to standard output with the words `selection`. `prelude` is what the shell,
  /// in the root, has in front of the program: what runs it, a limit, a zone in place of UTC, $H in
  /// place of a history that reaches back to before everything, $O in place of standard output.
  /// $J is as in `change`.
  [[nodiscard]] TestProcess startExport(std::vector<std::string> selection,
                                        const std::string& prelude = "") const;

  /// Waits for the end of an export. Returns what it has written that was not taken before, the
  /// lines that the system log got since the last call, and a status that is not 0.
  std::string finish(TestProcess& exporting);

  /// Exports to out.txt in the root. Returns that file's content and what `finish` does.
  std::string run(const std::vector<std::string>& selection = {"-p"},
                  const std::string& prelude = "");

 private:
  [[nodiscard]] std::string inRoot(const std::string& line) const;

  SystemLogSocket systemLog;
};
