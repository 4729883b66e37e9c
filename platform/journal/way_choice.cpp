#include "platform/journal/way_choice.h"

#include <algorithm>

void WayChoice::noteStep(bool selected) {
  constexpr std::size_t kIndexSteps = 512;
  constexpr std::size_t kFewestPlainSteps = 32;
  ++steps;
  selectedSteps += selected ? 1 : 0;
  if (steps >= (byIndex ? kIndexSteps : std::max(kFewestPlainSteps, matchCount))) {
    byIndex = !byIndex && isIndexWorthwhile();
    steps = 0;
    selectedSteps = 0;
  }
}

/// With the index a step costs about 0.3 of a plain one for each match, and without it there is a
/// step for each entry that is not selected. As one more is selected than was seen, many matches
/// take many steps to be worth it.
bool WayChoice::isIndexWorthwhile() const {
  return matchCount > 0 && (selectedSteps + 1) * (10 + 3 * matchCount) < steps * 10;
}
