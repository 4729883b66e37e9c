#pragma once

#include <cstddef>

/// Picks indexed or plain steps through a journal file, whichever are cheaper where the walk is.
///
/// An indexed step passes over most of the entries that are not selected, but takes longer than a
/// plain step to the next entry. The strategy samples some plain steps in a row, and steps by the
/// index for a while when few of the sampled entries were selected. On one thread.
class StepStrategy {
 public:
  /// `matches`: how many the index is asked for; 0 when there is no index. Starts with plain steps.
  explicit StepStrategy(std::size_t matches) : matchCount(matches) {}

  /// Whether the next step is by the index.
  [[nodiscard]] bool isByIndex() const { return byIndex; }

  /// Counts a step that leaves an entry. `selected`: whether that entry was selected.
  void noteStep(bool selected);

 private:
  [[nodiscard]] bool isIndexWorthwhile() const;

  std::size_t matchCount;
  bool byIndex = false;
  std::size_t steps = 0;          ///< Since `byIndex` was last decided.
  std::size_t selectedSteps = 0;  ///< Those of `steps` that left a selected entry.
};
