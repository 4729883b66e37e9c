#include "platform/journal/step_strategy.h"

#include <algorithm>

void StepStrategy::noteStep(bool selected) {
  constexpr std::size_t kIndexSteps = 2048;
  constexpr std::size_t kFewestPlainSteps = 32;
  ++steps;
  selectedSteps += selected ? 1 : 0;
  if (steps >= (byIndex ? kIndexSteps : std::max(kFewestPlainSteps, matchCount))) {
    byIndex = !byIndex && isIndexWorthwhile();
    steps = 0;
    selectedSteps = 0;
  }
}

/// An indexed step costs a plain step and 0.3 of one for each match. Plain steps also visit every
/// entry that is not selected. Counting one selected entry more than were seen keeps an index with
/// many matches from being tried too early.
bool StepStrategy::isIndexWorthwhile() const {
  return matchCount > 0 && (selectedSteps + 1) * (10 + 3 * matchCount) < steps * 10;
}
