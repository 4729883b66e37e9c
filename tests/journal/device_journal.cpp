#include "tests/journal/device_journal.h"

#include "simulator/journal.h"

#include <gtest/gtest.h>

simulator::JournalEntry message(long after, const std::string& text, Fields fields) {
  fields.emplace_back("MESSAGE", text);
  return {kTime + std::chrono::microseconds(after), std::move(fields)};
}

StoredEntries entries(std::size_t count, const std::string& text, std::size_t after,
                      std::size_t oneIn) {
  StoredEntries made;
  for (std::size_t at = 0; at < count; ++at) {
    const auto program = at % oneIn == 0 ? text : "other";
    made.push_back(
        message(static_cast<long>(after + at), program, {{"_EXE", "/usr/bin/" + program}}));
  }
  return made;
}

std::string exportFormat(const StoredEntries& entries) {
  std::string text;
  for (const auto& entry : entries) {
    text += simulator::toExportFormat(entry);
  }
  return text;
}

std::string messagesOf(const std::string& content) {
  std::string messages;
  for (auto end = content.find('\n'); end != std::string::npos; end = content.find('\n', end + 1)) {
    const auto start = content.rfind(' ', end) + 1;
    messages += content.substr(start, end - start) + " ";
  }
  return messages;
}

std::size_t countOf(const std::string& text, const std::string& content) {
  std::size_t count = 0;
  for (auto at = content.find(text); at != std::string::npos; at = content.find(text, at + 1)) {
    ++count;
  }
  return count;
}

DeviceJournal::DeviceJournal() : SimulatedDevice("BUS=no"), systemLog(root()) {
  std::filesystem::create_directories(journals());
}

std::filesystem::path DeviceJournal::journals() const {
  return (root() / simulator::kJournalFile).parent_path();
}

TestProcess DeviceJournal::startStoring(const std::string& name) const {
  return TestProcess({JOURNAL_REMOTE, "-o", journals() / name, "-"});
}

void DeviceJournal::store(const std::string& name, const StoredEntries& entries) const {
  auto storing = startStoring(name);
  storing.write(exportFormat(entries));
  const auto result = storing.finish();
  ASSERT_EQ(result.status, 0) << result.errors;
}

Export DeviceJournal::run(const std::vector<std::string>& selection, const std::string& prelude,
                          const std::string& history) {
  std::vector<std::string> words = {history, output()};
  words.insert(words.end(), selection.begin(), selection.end());
  const auto [status, printed, errors] =
      runLine("export TZ=UTC0; " + prelude + " '" OSLOG_EXPORT_PATH "' \"$@\"", words);
  EXPECT_EQ(printed + errors, "");
  const bool isFile = std::filesystem::is_regular_file(output());
  return {status, isFile ? contentOf(output()) : "", messages()};
}
