#include "platform/linux/journal/journal_index.h"

#include "platform/linux/journal/journal_fields.h"

#include <functional>
#include <string_view>
#include <utility>

namespace {

std::string_view nameOf(JournalField field) {
  return kJournalFieldNames[indexOf(field)];
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
  const auto selectsPath = [&](std::string_view path) { return selection.selectsImagePath(path); };
  const auto selectsName = [&](std::string_view name) { return selection.selectsProcess(name); };
  const auto selectsExecutable = [&](std::string_view path) {
    return selectsName(lastComponent(path)) || selectsPath(path);
  };
  std::vector<std::string> matches;
  const auto add = [&](JournalField field, const auto& wanted) {
    return addWantedValues(journal, field, wanted, matches);
  };
  // An entry without an executable goes by its other names, and one with an executable has them
  // too: what they match in vain is asked and passed over.
  const bool listed = add(JournalField::Executable, selectsExecutable) &&
                      add(JournalField::SenderImagePath, selectsPath) &&
                      add(JournalField::CommandName, selectsName) &&
                      add(JournalField::SyslogIdentifier, selectsName);
  return listed ? std::optional(std::move(matches)) : std::nullopt;
}
