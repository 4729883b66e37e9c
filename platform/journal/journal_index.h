#pragma once

#include "platform/journal/log_selection.h"
#include "platform/journal/step_strategy.h"

#include <systemd/sd-journal.h>

#include <optional>
#include <string>
#include <vector>

/// Asks the index of a journal about `selection`, which is not everything. Returns exact matches
/// ("FIELD=value", see sd_journal_add_match(3)), those of one field in a row. Every selected entry
/// satisfies at least one; other entries may too. Empty: nothing is selected. nullopt: the index
/// cannot tell.
std::optional<std::vector<std::string>> findIndexMatches(sd_journal* journal,
                                                         const LogSelection& selection);

/// The index of one journal file, and whether steps through the file go by it. Does not own the
/// journal, which each call is given. On one thread.
class JournalIndex {
 public:
  /// An index that is not used: all steps are plain.
  JournalIndex() = default;

  /// An index that is asked for `found`, as `findIndexMatches` returns them.
  explicit JournalIndex(std::vector<std::string> found)
      : matches(std::move(found)), strategy(matches.size()) {}

  /// Whether the index is used where that is worth it.
  [[nodiscard]] bool isUsed() const { return !matches.empty(); }

  /// Has the next steps go by the index. False when the library cannot do that.
  bool enable(sd_journal* journal);

  /// Has the next steps be plain.
  void disable(sd_journal* journal);

  /// Notes a step that leaves an entry, `selected` or not. Enables or disables the index for the
  /// next step, whichever is cheaper there.
  void chooseNextStep(sd_journal* journal, bool selected);

 private:
  std::vector<std::string> matches;
  StepStrategy strategy{0};
  bool enabled = false;
};
