#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace fs = std::filesystem;

simulator::JournalEntry message(long after, const std::string& text, Fields fields) {
  fields.emplace_back("MESSAGE", text);
  return {kTime + std::chrono::microseconds(after), std::move(fields)};
}

StoredEntries entries(std::size_t count, const std::string& text, std::size_t after,
                      std::size_t oneIn) {
  StoredEntries made;
  for (std::size_t at = 0; at < count; ++at) {
    made.push_back(message(static_cast<long>(after + at), text, {{"_EXE", "/usr/bin/" + text}}));
    if (at % oneIn != 0) {
      made.back().fields = {{"_EXE", "/usr/bin/other"}};
    }
  }
  return made;
}

std::string lastWords(const std::string& text) {
  std::string words;
  for (auto end = text.find('\n'); end != std::string::npos; end = text.find('\n', end + 1)) {
    const auto start = text.rfind(' ', end) + 1;
    words += text.substr(start, end - start) + " ";
  }
  return words;
}

std::string DeviceJournal::inRoot(const std::string& line) const {
  return "cd \"$VELL_SYSROOT\"; J=" + kJournals.string() + "; " + line;
}

void DeviceJournal::store(const std::string& name, const StoredEntries& entries) const {
  const auto file = root() / kJournals / name;
  fs::create_directories(file.parent_path());
  std::string text;
  for (const auto& entry : entries) {
    text += simulator::toExportFormat(entry);
  }
  TestProcess storing({JOURNAL_REMOTE, "-o", file, "-"});
  storing.write(text);
  const auto result = storing.finish();
  ASSERT_EQ(result.status, 0) << result.errors;
}

std::string DeviceJournal::change(const std::string& line) {
  const auto result = runLine(inRoot(line));
  EXPECT_EQ(result.errors, "") << line;
  return result.output;
}

TestProcess DeviceJournal::startExport(std::vector<std::string> selection,
                                       const std::string& prelude) const {
  const auto line = inRoot("export TZ=UTC0; H=2147483647; O=/dev/stdout; " + prelude +
                           " '" OSLOG_EXPORT_PATH "' $H $O \"$@\"");
  selection.insert(selection.begin(), {"bash", "-c", line, "bash"});
  return start(std::move(selection));
}

std::string DeviceJournal::finish(TestProcess& exporting) {
  auto [status, text, errors] = exporting.finish();
  const auto folder = (root() / kJournals.parent_path()).string() + "/";
  for (auto message : systemLog.messages()) {
    for (const auto& part : {folder, kJournals.filename().string() + "/"}) {
      const auto at = message.find(part);
      message.erase(std::min(at, message.size()), part.size());
    }
    text += message + "\n";
  }
  return text + errors + (status == 0 ? "" : "status " + std::to_string(status) + "\n");
}

std::string DeviceJournal::run(const std::vector<std::string>& selection,
                               const std::string& prelude) {
  auto exporting = startExport(selection, "O=out.txt; " + prelude);
  const auto told = finish(exporting);
  const auto file = root() / "out.txt";
  return (fs::is_regular_file(file) ? contentOf(file) : "") + told;
}
