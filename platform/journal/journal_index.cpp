#include "platform/journal/journal_index.h"

#include "platform/journal/journal_fields.h"

#include <functional>
#include <string_view>
#include <utility>

namespace {

std::string_view nameOf(JournalField field) {
  return kJournalFieldNames[indexOf(field)];
}

/// What is found in the index.
struct Finding {
  std::vector<std::string> matches;
  bool hasValues = false;  ///< Whether there was any value, wanted or not.
};

/// Adds a match for each of the distinct values of `field` that is `wanted`. False when the index
/// cannot list them all.
bool addWantedValues(sd_journal* journal, JournalField field,
                     const std::function<bool(std::string_view)>& wanted, Finding& finding) {
  const std::string name(nameOf(field));
  if (sd_journal_query_unique(journal, name.c_str()) < 0) {
    return false;
  }
  const void* data = nullptr;
  std::size_t length = 0;
  int more = sd_journal_enumerate_unique(journal, &data, &length);
  for (; more > 0; more = sd_journal_enumerate_unique(journal, &data, &length)) {
    const std::string_view match(static_cast<const char*>(data), length);
    finding.hasValues = true;
    if (wanted(match.substr(name.size() + 1))) {
      finding.matches.emplace_back(match);
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
  Finding finding;
  const auto add = [&](JournalField field, const auto& wanted) {
    return addWantedValues(journal, field, wanted, finding);
  };
  // An entry without an executable goes by its other names, and one with an executable has them
  // too: what they match in vain is asked and passed over.
  const bool listed = add(JournalField::Executable, selectsExecutable) &&
                      add(JournalField::SenderImagePath, selectsPath) &&
                      add(JournalField::CommandName, selectsName) &&
                      add(JournalField::SyslogIdentifier, selectsName);
  // Entries hardly ever have none of these fields, and an index that knows of none is damaged.
  return listed && finding.hasValues ? std::optional(std::move(finding.matches)) : std::nullopt;
}
