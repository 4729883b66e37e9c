#pragma once

#include "platform/journal/journal_fields.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

/// Journal entries on their way from the thread that reads them to the one that delivers them. The
/// values of all of them lie one after the other in one piece of memory, which is used again.
class EntryBatch {
 public:
  /// When an entry was stored, in which file, and where there; times in microseconds.
  struct Stamp {
    std::uint64_t realtime = 0;
    std::uint64_t reached = 0;  ///< The latest time that the walk through its file has come to.
    std::size_t file = 0;
    std::string cursor;  ///< Empty when no other file has entries of that time.
  };

  /// Starts an entry without values.
  void begin(Stamp stamp);

  /// Gives the entry begun last a value. Of several for one field the first counts.
  void add(JournalField field, std::string_view value);

  /// Takes back the entry begun last.
  void dropLast();

  /// Takes back all entries, and gives back the memory of a batch that was larger than usual.
  void clear();

  [[nodiscard]] std::size_t size() const { return entries.size(); }
  [[nodiscard]] bool isEmpty() const { return entries.empty(); }

  /// Whether it is time to hand the batch on.
  [[nodiscard]] bool isFull() const;

  /// The size of all values together.
  [[nodiscard]] std::size_t byteCount() const { return bytes.size(); }

  [[nodiscard]] const Stamp& stampOf(std::size_t entry) const { return entries[entry].stamp; }

  /// One value of an entry; good until the batch changes.
  [[nodiscard]] std::optional<std::string_view> valueOf(std::size_t entry,
                                                        JournalField field) const;

  /// The values of an entry; good until the batch changes.
  [[nodiscard]] JournalValues valuesOf(std::size_t entry) const;

 private:
  struct Span {
    std::size_t start = std::string::npos;  ///< None when there is no value.
    std::size_t length = 0;
  };
  struct Entry {
    Stamp stamp;
    std::size_t start = 0;
    PerJournalField<Span> values;
  };

  std::string bytes;
  std::vector<Entry> entries;
};
