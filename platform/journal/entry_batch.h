#pragma once

#include "platform/journal/journal_fields.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

/// Journal entries on their way from the reading thread to the delivering thread. The values of all
/// of them share one piece of memory, which is used again after `clear`. One thread at a time.
class EntryBatch {
 public:
  /// Appends an entry without values that was stored at `realtime`, in microseconds.
  void begin(std::uint64_t realtime);

  /// Adds a value to the last entry. Of several values of one field the first counts.
  void add(JournalField field, std::string_view value);

  /// Removes the last entry.
  void dropLast();

  /// Removes all entries. Frees the memory of a batch that was larger than usual.
  void clear();

  [[nodiscard]] std::size_t size() const { return entries.size(); }
  [[nodiscard]] bool isEmpty() const { return entries.empty(); }

  /// Whether the batch is large enough to be handed on.
  [[nodiscard]] bool isFull() const;

  /// The size of all values together.
  [[nodiscard]] std::size_t byteCount() const { return bytes.size(); }

  /// When an entry was stored, in microseconds.
  [[nodiscard]] std::uint64_t realtimeOf(std::size_t entry) const {
    return entries[entry].realtime;
  }

  /// One value of an entry; valid until the batch changes.
  [[nodiscard]] std::optional<std::string_view> valueOf(std::size_t entry,
                                                        JournalField field) const;

  /// All values of an entry; valid until the batch changes.
  [[nodiscard]] JournalValues valuesOf(std::size_t entry) const;

 private:
  struct Span {
    std::size_t start = std::string::npos;  ///< In `bytes`; npos when there is no value.
    std::size_t length = 0;
  };
  struct Entry {
    std::uint64_t realtime = 0;
    std::size_t start = 0;  ///< Where its values start in `bytes`.
    PerJournalField<Span> values;
  };

  std::string bytes;
  std::vector<Entry> entries;
};
