// The parts of the log reader that need no journal.

#include "platform/journal/batch_queue.h"
#include "platform/journal/duplicate_filter.h"
#include "platform/journal/journal_files.h"
#include "platform/journal/step_strategy.h"

#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <string>
#include <vector>

namespace {

EntryBatch makeBatch(std::size_t bytes) {
  EntryBatch batch;
  batch.begin(0);
  batch.add(JournalField::Message, std::string(bytes, 'x'));
  return batch;
}

TEST(BatchQueue, TakesBatchesUpToItsBoundsUntilItIsClosed) {
  const struct {
    std::size_t bytes;  ///< Of each batch.
    int most;           ///< How many batches have room.
  } cases[] = {{0, 24}, {1 << 20, 6}, {7 << 20, 1}};
  for (const auto& [bytes, most] : cases) {
    BatchQueue queue;
    std::atomic<int> queued = 0;
    const auto await = [&](int count) {
      for (int now = queued; now < count; now = queued) {
        queued.wait(now);
      }
    };
    auto pushing = std::async(std::launch::async, [&queue, &queued, size = bytes] {
      for (auto batch = makeBatch(size); queue.push(batch); batch = makeBatch(size)) {
        ++queued;
        queued.notify_one();
      }
    });
    await(most);
    EntryBatch batch;
    EXPECT_TRUE(queue.pop(batch));
    EXPECT_EQ(batch.byteCount(), bytes);
    await(most + 1);
    queue.close();
    pushing.wait();
    EXPECT_EQ(queued, most + 1);
    EXPECT_FALSE(queue.pop(batch));
  }
}

TEST(DuplicateFilter, ComparesSequenceAndNumberOrElseBootTimesAndContent) {
  const struct {
    std::uint64_t realtime;
    std::string cursor;
    bool isDuplicate;
  } cases[] = {{1, "s=a;i=1;b=b;m=1;t=1;x=1", false},
               {1, "s=a;i=1;b=b;m=1;t=1;x=1", true},
               {1, "s=a;i=2;b=b;m=1;t=1;x=1", false},
               {1, "s=c;i=9;b=b;m=1;t=1;x=1", true},
               {1, "s=c;i=8;b=b;m=1;t=1;x=2", false},
               {1, "s=d;i=8;b=e;m=1;t=1;x=2", false},
               {1, "", false},
               {1, "", false},
               {1, "s=a;i=2;b=b;m=1;t=1;x=1", true},
               {2, "s=a;i=1;b=b;m=1;t=1;x=1", false}};
  DuplicateFilter filter;
  for (const auto& [realtime, cursor, isDuplicate] : cases) {
    EXPECT_EQ(filter.isDuplicate(realtime, cursor), isDuplicate) << realtime << " " << cursor;
  }
}

TEST(JournalPlace, GoesByTheSequenceOrElseByTheBoot) {
  const std::string a(32, 'a');
  const std::string b(32, 'b');
  const auto place = [](const std::string& sequence, const std::string& number,
                        const std::string& boot, const std::string& monotonic) {
    return JournalPlace::fromCursor("s=" + sequence + ";i=" + number + ";b=" + boot +
                                    ";m=" + monotonic);
  };
  EXPECT_FALSE(place("soon", "1", a, "1") || place(a, "", a, "1") || JournalPlace::fromCursor(""));
  const auto left = place(a, "9", a, "1f").value();
  EXPECT_TRUE(isStoredBefore(left, place(a, "a", a, "1e").value()));
  EXPECT_FALSE(isStoredBefore(left, place(a, "9", a, "ff").value()));
  EXPECT_TRUE(isStoredBefore(left, place(b, "1", a, "20").value()));
  EXPECT_FALSE(isStoredBefore(left, place(b, "a", a, "1f").value()));
  EXPECT_FALSE(isStoredBefore(left, place(b, "a", b, "20").value()));
}

TEST(JournalFiles, OverlapIsTheSpanThatAFileSharesWithOthers) {
  const std::pair<TimeSpan, TimeSpan> cases[] = {{{1, 10}, {4, 10}},
                                                 {{4, 6}, {4, 6}},
                                                 {{10, 20}, {10, 20}},
                                                 {{20, 20}, {20, 20}},
                                                 {{21, 30}, {}}};
  std::vector<JournalFile> files(std::size(cases));
  for (std::size_t at = 0; at < files.size(); ++at) {
    files[at].stored = cases[at].first;
  }
  findOverlaps(files);
  for (std::size_t at = 0; at < files.size(); ++at) {
    EXPECT_EQ(files[at].overlap.first, cases[at].second.first) << at;
    EXPECT_EQ(files[at].overlap.last, cases[at].second.last) << at;
  }
}

TEST(StepStrategy, PicksTheIndexWhereFewEntriesAreSelected) {
  const struct {
    std::size_t matches;
    std::size_t oneIn;  ///< Of so many entries one is selected.
    std::size_t byIndex;
  } cases[] = {{0, 1000, 0}, {1, 1000, 5120}, {20, 33, 5120}, {1, 2, 5120},
               {1, 1, 0},    {20, 5, 0},      {300, 33, 0},   {300, 1000, 3341}};
  for (const auto& [matches, oneIn, byIndex] : cases) {
    // Where the index is better, and its matches few, 32 plain steps take turns with 512 by it.
    StepStrategy strategy(matches);
    std::size_t steps = 0;
    for (std::size_t at = 0; at < std::size_t{10} * (32 + 512); ++at) {
      strategy.noteStep(!strategy.isByIndex() && at % oneIn == 0);
      steps += strategy.isByIndex() ? 1 : 0;
    }
    EXPECT_EQ(steps, byIndex) << matches << ", one in " << oneIn;
  }
}

}  // namespace
