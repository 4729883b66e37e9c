#pragma once

#include <cstddef>

/// Chooses between the two ways through a journal file: by its index, which passes over most of the
/// entries that are not selected but takes longer for a step, or to every entry. As the one or the
/// other may be better in parts of the file, it looks at a few entries in a row from time to time,
/// and goes by the index in between when few of them were selected. On one thread.
class WayChoice {
 public:
  /// For an index that is asked for that many matches; for none there is no choice. The first way
  /// is to every entry.
  explicit WayChoice(std::size_t matches) : matchCount(matches) {}

  /// Whether the next step is by the index.
  [[nodiscard]] bool isByIndex() const { return byIndex; }

  /// Takes note of a step that left an entry which was `selected` or was not.
  void noteStep(bool selected);

 private:
  [[nodiscard]] bool isIndexWorthwhile() const;

  std::size_t matchCount;
  bool byIndex = false;
  std::size_t steps = 0;          ///< Since the way was chosen.
  std::size_t selectedSteps = 0;  ///< Those of them that left a selected entry.
};
