#include "platform/journal/way_choice.h"

#include <gtest/gtest.h>

TEST(WayChoice, IsTheIndexWhereFewEntriesAreSelected) {
  const struct {
    std::size_t matches;
    std::size_t oneIn;  ///< Of so many entries one is selected.
    std::size_t byIndex;
  } cases[] = {{0, 1000, 0}, {1, 1000, 5120}, {20, 33, 5120}, {1, 2, 5120},
               {1, 1, 0},    {20, 5, 0},      {300, 33, 0},   {300, 1000, 3341}};
  for (const auto& [matches, oneIn, byIndex] : cases) {
    // Where the index is better, and its matches few, 32 plain steps take turns with 512 by it.
    WayChoice way(matches);
    std::size_t steps = 0;
    for (std::size_t at = 0; at < std::size_t{10} * (32 + 512); ++at) {
      way.noteStep(!way.isByIndex() && at % oneIn == 0);
      steps += way.isByIndex() ? 1 : 0;
    }
    EXPECT_EQ(steps, byIndex) << matches << ", one in " << oneIn;
  }
}
