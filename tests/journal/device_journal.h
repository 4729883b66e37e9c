#pragma once

#include "tests/end_to_end/system_log_socket.h"
#include "tests/end_to_end/test_process.h"

#include <cstdint>
#include <filesystem>
#include <map>
#include <string>
#include <utility>
#include <vector>

/// One entry to be stored.
struct StoredEntry {
  std::uint64_t realtime = 0;                               ///< In microseconds.
  std::vector<std::pair<std::string, std::string>> fields;  ///< Values of any bytes.
};

/// `entries` in the journal's export format.
std::string exportFormat(const std::vector<StoredEntry>& entries);

/// What an export left behind.
struct Export {
  int status = 0;                     ///< Of the exporting process.
  std::string content;                ///< Of its file; empty when there is none to read.
  std::vector<std::string> messages;  ///< In the system log.
};

/// A device that is nothing but a folder with journals, which go with it.
class DeviceJournal {
 public:
  DeviceJournal();
  DeviceJournal(const DeviceJournal&) = delete;
  DeviceJournal& operator=(const DeviceJournal&) = delete;
  ~DeviceJournal();

  [[nodiscard]] const std::filesystem::path& root() const { return folder; }

  /// Where the journal files are.
  [[nodiscard]] std::filesystem::path journals() const;

  /// Where `run` has the export write to, unless its words say otherwise.
  [[nodiscard]] std::filesystem::path output() const { return folder / "out.txt"; }

  /// Makes the journal file `name` ("system.journal") of `entries`.
  void store(const std::string& name, const std::vector<StoredEntry>& entries) const;

  /// Starts to store what is written to the process's input, in export format.
  [[nodiscard]] TestProcess startStoring(const std::string& name) const;

  /// Exports everything stored with the words `selection`, in the time zone `zone`.
  Export run(const std::vector<std::string>& selection = {"-p"}, const std::string& zone = "UTC0");

  /// As `run`, with all the words given, and `runner` in front of them.
  Export runWords(const std::vector<std::string>& words, const std::string& zone = "UTC0",
                  std::vector<std::string> runner = {});

  /// What starts an export.
  [[nodiscard]] ProcessStart exporting(const std::vector<std::string>& words) const;

  /// The messages in the system log since they were last asked for.
  std::vector<std::string> messages() { return systemLog.messages(); }

 private:
  std::filesystem::path folder;
  SystemLogSocket systemLog;
};

/// A history that reaches back to before everything the tests store.
inline constexpr const char* kAllOfHistory = "2147483647";

/// What every export that gets as far as the reader tells the system log.
std::string startedMessage(const std::string& history = kAllOfHistory);

/// How often `text` stands in `content`.
std::size_t countOf(const std::string& text, const std::string& content);
