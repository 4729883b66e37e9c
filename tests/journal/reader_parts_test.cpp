// The parts of the log reader that need no journal.

#include "platform/journal/batch_queue.h"
#include "platform/journal/duplicate_filter.h"
#include "platform/journal/journal_place.h"
#include "platform/journal/machine_time_zone.h"
#include "platform/journal/turns.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <ctime>
#include <optional>
#include <semaphore>
#include <string>
#include <thread>
#include <utility>
#include <vector>

namespace {

TEST(BatchQueue, TakesBatchesUpToItsBoundsUntilItIsClosed) {
  // How large each batch is, and how many have room.
  for (const auto& [bytes, most] : {std::pair(0U, 24), {1U << 20, 6}, {7U << 20, 1}}) {
    SCOPED_TRACE(most);
    BatchQueue queue;
    std::counting_semaphore<> pushes(0);
    std::thread pushing([&queue, &pushes, text = std::string(bytes, 'x')] {
      EntryBatch batch;
      do {
        batch.begin(0);
        batch.add(JournalField::Message, text);
        pushes.release();
      } while (queue.push(batch));
    });
    EntryBatch batch;
    EXPECT_TRUE(queue.pop(batch));
    // One more has room then, and the next one waits.
    for (int count = 0; count < most + 2; ++count) {
      pushes.acquire();
    }
    EXPECT_FALSE(pushes.try_acquire_for(std::chrono::milliseconds(20)));
    queue.close();
    pushing.join();
    EXPECT_FALSE(queue.pop(batch));
  }
}

TEST(DuplicateFilter, TellsBootsApartAndTakesNothingWithoutACursorForACopy) {
  DuplicateFilter filter;
  for (const auto* cursor : {"s=a;i=1;b=a;m=1;t=1;x=1", "s=b;i=1;b=b;m=1;t=1;x=1", "", ""}) {
    EXPECT_FALSE(filter.isDuplicate(1, cursor)) << cursor;
  }
}

TEST(JournalPlace, GoesByTheSequenceOrElseByTheBoot) {
  const auto left = JournalPlace::fromCursor("s=a;i=9;b=a;m=1f").value();
  for (const auto& [cursor, isAfter] : {std::pair("s=a;i=a;b=a;m=1e", true),
                                        {"s=a;i=9;b=a;m=ff", false},
                                        {"s=b;i=1;b=a;m=20", true},
                                        {"s=b;i=a;b=a;m=1f", false},
                                        {"s=b;i=a;b=b;m=20", false}}) {
    EXPECT_EQ(isStoredBefore(left, JournalPlace::fromCursor(cursor).value()), isAfter) << cursor;
  }
  EXPECT_FALSE(JournalPlace::fromCursor("s=a;i=;b=a;m=1") || JournalPlace::fromCursor(""));
}

TEST(Turns, FollowTheOrderOfBeingStored) {
  struct File {
    std::vector<std::uint64_t> times;
    std::optional<JournalPlace> first = {}, last = {};
  };
  const auto at = [](std::uint64_t number) { return JournalPlace{"a", number, "a", 1}; };
  const std::pair<std::vector<File>, std::string> cases[] = {
      // By time; behind those that were stored before; last what waits for each other.
      {{{{1, 3, 4}}, {{2, 3, 4}}, {{2, 5}}}, "01201102"},
      {{{{1, 2}, at(7)}, {{8, 9}, at(1), at(3)}, {{5, 8, 30}}}, "2211002"},
      {{{{9}, at(1), at(1)}, {{6}, at(5), at(5)}, {{3}, at(9), at(9)}}, "012"},
      {{{{4, 7}, at(6), at(1)}, {{5}, at(6), at(1)}, {{9}}}, "2010"}};
  for (auto [files, expected] : cases) {
    Turns turns;
    for (const auto& file : files) {
      turns.add(file.first, file.last, file.times.front());
    }
    std::string taken;
    while (const auto next = turns.next()) {
      auto& times = files[*next].times;
      do {
        taken += std::to_string(*next);
        times.erase(times.begin());
      } while (!times.empty() && turns.reach(times.front()));
      if (times.empty()) {
        turns.end();
      }
    }
    EXPECT_EQ(taken, expected);
  }
}

TEST(MachineTimeZone, IsWhatTheLibrarySaysAtAnyTime) {
  setenv("TZ", "OLD-1NEW,J60/1:07:09,J300", 1);
  const MachineTimeZone timeZone;
  // A year from 2021 on, back and forth by some minutes.
  for (std::time_t next = 1'609'459'200; next < 1'640'995'200; next += 299) {
    for (const auto time : {next, next - 600}) {
      std::tm local{};
      localtime_r(&time, &local);
      const auto offset = timeZone.offsetAt(std::chrono::sys_seconds(std::chrono::seconds(time)));
      ASSERT_EQ(offset.count(), local.tm_gmtoff) << time;
    }
  }
}

}  // namespace
