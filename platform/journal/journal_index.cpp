#include "platform/journal/journal_index.h"

#include "platform/journal/journal_fields.h"
#include "platform/process_end.h"

#include <algorithm>
#include <cerrno>
#include <functional>
#include <string_view>
#include <utility>

namespace {

struct Finding {
  std::vector<std::string> matches;
  bool hasValues = false;  ///< Whether the index listed any value, wanted or not.
};

/// Adds a match for each distinct value of `field` that is `wanted`. False when the index cannot
/// list them all.
bool addWantedValues(sd_journal* journal, JournalField field,
                     const std::function<bool(std::string_view)>& wanted, Finding& finding) {
  const std::string name(kJournalFieldNames[indexOf(field)]);
  if (checked(sd_journal_query_unique(journal, name.c_str())) < 0) {
    return false;
  }
  const void* data = nullptr;
  std::size_t length = 0;
  int more = 0;
  while ((more = sd_journal_enumerate_unique(journal, &data, &length)) > 0) {
    const std::string_view match(static_cast<const char*>(data), length);
    finding.hasValues = true;
    if (wanted(match.substr(name.size() + 1))) {
      finding.matches.emplace_back(match);
    }
  }
  if (more == -ENOMEM) {
    endWithoutMemory();  // This comes of a damaged compressed value, too.
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
  // An entry without an executable is selected by its other names. An entry with an executable has
  // those names too: it may match by them and still not be selected.
  const bool listed = add(JournalField::Executable, selectsExecutable) &&
                      add(JournalField::SenderImagePath, selectsPath) &&
                      add(JournalField::CommandName, selectsName) &&
                      add(JournalField::SyslogIdentifier, selectsName);
  // Hardly any journal has none of these fields: an index that lists no value at all is damaged.
  return listed && finding.hasValues ? std::optional(std::move(finding.matches)) : std::nullopt;
}

/// The library takes matches of one field for alternatives. Different fields need a disjunction.
bool JournalIndex::enable(sd_journal* journal) {
  if (enabled) {
    return true;
  }
  std::string_view lastName;
  enabled = std::all_of(matches.begin(), matches.end(), [&](const std::string& match) {
    const auto name = std::string_view(match).substr(0, match.find('='));
    const bool sameField = std::exchange(lastName, name) == name;
    return (sameField || checked(sd_journal_add_disjunction(journal)) >= 0) &&
           checked(sd_journal_add_match(journal, match.data(), match.size())) >= 0;
  });
  if (!enabled) {
    disable(journal);
  }
  return enabled;
}

void JournalIndex::disable(sd_journal* journal) {
  sd_journal_flush_matches(journal);
  enabled = false;
}

void JournalIndex::chooseNextStep(sd_journal* journal, bool selected) {
  strategy.noteStep(selected);
  if (strategy.isByIndex() && !enabled) {
    enable(journal);
  } else if (!strategy.isByIndex() && enabled) {
    disable(journal);
  }
}
