#include "platform/linux/journal_index.h"

#include "platform/linux/journal_fields.h"

#include <functional>
#include <string_view>
#include <utility>

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";

std::string_view nameOf(JournalField field) {
  return kJournalFieldNames[indexOf(field)];
}

std::string matchOf(JournalField field, std::string_view value) {
  return std::string(nameOf(field)).append("=").append(value);
}

/// Adds a match for each of the distinct values of `field` that is `wanted`. False when the index
/// cannot list them all.
bool addWantedValues(sd_journal* journal, JournalField field,
                     const std::function<bool(std::string_view)>& wanted,
                     std::vector<std::string>& matches) {
  const std::string name(nameOf(field));
  if (sd_journal_query_unique(journal, name.c_str()) < 0) {
    return false;
  }
  const void* data = nullptr;
  std::size_t length = 0;
  int more = sd_journal_enumerate_unique(journal, &data, &length);
  for (; more > 0; more = sd_journal_enumerate_unique(journal, &data, &length)) {
    const std::string_view match(static_cast<const char*>(data), length);
    if (wanted(match.substr(name.size() + 1))) {
      matches.emplace_back(match);
    }
  }
  return more == 0;
}

}  // namespace

std::optional<std::vector<std::string>> findIndexMatches(sd_journal* journal,
                                                         const LogSelection& selection) {
  std::vector<std::string> matches;
  const auto selectsPath = [&](std::string_view path) { return selection.selectsImagePath(path); };
  const auto selectsExecutable = [&](std::string_view path) {
    return selection.selectsProcess(lastComponent(path)) || selectsPath(path);
  };
  if (!addWantedValues(journal, JournalField::Executable, selectsExecutable, matches) ||
      !addWantedValues(journal, JournalField::SenderImagePath, selectsPath, matches)) {
    return std::nullopt;
  }
  // An entry without an executable goes by its other names, which need not be listed to be matched.
  for (const auto& name : selection.processNames()) {
    if (name.find(kReplacement) != std::string::npos) {
      // This may stand for broken bytes, and only the listing of all values would tell for which.
      return std::nullopt;
    }
    matches.push_back(matchOf(JournalField::CommandName, name));
    matches.push_back(matchOf(JournalField::SyslogIdentifier, name));
  }
  return matches;
}
