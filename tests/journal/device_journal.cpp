#include "tests/journal/device_journal.h"

#include <endian.h>

#include <cstdlib>
#include <stdexcept>

namespace {

constexpr const char* kMachine = "0123456789abcdef0123456789abcdef";

std::filesystem::path makeFolder() {
  std::string path = std::filesystem::temp_directory_path() / "vell-journal-XXXXXX";
  if (mkdtemp(path.data()) == nullptr) {
    throw std::system_error(errno, std::generic_category(), path);
  }
  return path;
}

void appendField(std::string& text, const std::string& name, const std::string& value) {
  if (value.empty()) {
    // The form with a length is not for these.
    text.append(name).append("=\n");
    return;
  }
  const std::uint64_t size = htole64(value.size());
  text.append(name).append("\n").append(reinterpret_cast<const char*>(&size), sizeof size);
  text.append(value).append("\n");
}

}  // namespace

std::string exportFormat(const std::vector<StoredEntry>& entries) {
  std::string text;
  for (const auto& entry : entries) {
    const auto time = std::to_string(entry.realtime);
    text.append("__REALTIME_TIMESTAMP=").append(time);
    text.append("\n__MONOTONIC_TIMESTAMP=").append(time);
    text.append("\n_BOOT_ID=4f1c3c3a4c0d4e2b9a0b7c6d5e4f3a2b\n");
    for (const auto& [name, value] : entry.fields) {
      appendField(text, name, value);
    }
    text += "\n";
  }
  return text;
}

DeviceJournal::DeviceJournal() : folder(makeFolder()), systemLog(folder) {
  std::filesystem::create_directories(journals());
}

DeviceJournal::~DeviceJournal() {
  std::error_code ignored;
  std::filesystem::remove_all(folder, ignored);
}

std::filesystem::path DeviceJournal::journals() const {
  return folder / "var/log/journal" / kMachine;
}

TestProcess DeviceJournal::startStoring(const std::string& name) const {
  ProcessStart start;
  start.words = {JOURNAL_REMOTE, "-o", journals() / name, "-"};
  return TestProcess(start);
}

void DeviceJournal::store(const std::string& name, const std::vector<StoredEntry>& entries) const {
  auto storing = startStoring(name);
  storing.write(exportFormat(entries));
  if (const auto result = storing.finish(); result.status != 0) {
    throw std::runtime_error(result.errors);
  }
}

ProcessStart DeviceJournal::exporting(const std::vector<std::string>& words) const {
  ProcessStart start;
  start.words = {OSLOG_EXPORT_PATH};
  start.environment = {{"VELL_SYSROOT", folder}};
  start.words.insert(start.words.end(), words.begin(), words.end());
  return start;
}

Export DeviceJournal::run(const std::vector<std::string>& selection, const std::string& zone) {
  std::vector<std::string> words{kAllOfHistory, output()};
  words.insert(words.end(), selection.begin(), selection.end());
  return runWords(words, zone);
}

Export DeviceJournal::runWords(const std::vector<std::string>& words, const std::string& zone,
                               std::vector<std::string> runner) {
  auto start = exporting(words);
  start.environment["TZ"] = zone;
  start.words.insert(start.words.begin(), runner.begin(), runner.end());
  const auto result = TestProcess(start).finish();
  if (!result.errors.empty()) {
    throw std::runtime_error(result.errors);
  }
  const bool isFile = std::filesystem::is_regular_file(words.at(1));
  return {result.status, isFile ? contentOf(words.at(1)) : "", messages()};
}

std::string startedMessage(const std::string& history) {
  return "Getting oslog stream: history = " + history + ".000000";
}

std::size_t countOf(const std::string& text, const std::string& content) {
  std::size_t count = 0;
  for (auto at = content.find(text); at != std::string::npos; at = content.find(text, at + 1)) {
    ++count;
  }
  return count;
}
