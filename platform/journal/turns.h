#pragma once

#include "platform/journal/journal_place.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <utility>
#include <vector>

/// Decides which of several journal files is read next, so that their entries come in the order of
/// being stored. A file waits for those that were stored before it; the others take turns by time.
/// Files that wait for each other, as damaged or forged ones may do, come last. On one thread.
class Turns {
 public:
  /// Adds a file. Files are numbered from 0 in this order. Call before the first `next`. `first`,
  /// `last`: the places of its first and last entry, if known. `reached`: the latest time that it
  /// has come to, in microseconds; a lower bound for a file that is not started.
  void add(std::optional<JournalPlace> first, std::optional<JournalPlace> last,
           std::uint64_t reached);

  /// Gives the turn to the file that is due, also in the middle of a turn. Returns its number;
  /// nullopt when all have ended. Of files that are due alike it takes the one added first.
  std::optional<std::size_t> next();

  /// Sets the latest time, in microseconds, that the file whose turn it is has come to. Returns
  /// whether it goes on: no other file is due before it. Call only while a file has its turn.
  bool reach(std::uint64_t time);

  /// Ends the file whose turn it is, and lets the files go on that had to wait for it. Then none
  /// has its turn.
  void end();

 private:
  /// A file that has not ended, and how many such files were stored before it.
  struct File {
    std::size_t number = 0;
    std::optional<JournalPlace> first;
    std::optional<JournalPlace> last;
    std::uint64_t reached = 0;
    std::size_t openPredecessors = 0;
  };

  /// Whether a file has to wait, and the latest time that it has come to.
  using Rank = std::pair<bool, std::uint64_t>;

  static Rank rankOf(const File& file) { return {file.openPredecessors > 0, file.reached}; }
  static bool precedes(const File& left, const File& right);

  std::vector<File> files;
  std::size_t current = 0;  ///< Index of the file whose turn it is.
  Rank following;           ///< The lowest of the other files, as of the last `next`.
};
