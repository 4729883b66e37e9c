#include "platform/journal/entry_batch.h"

namespace {

constexpr std::size_t kFullEntries = 256;
constexpr std::size_t kFullBytes = 256UL * 1024;

}  // namespace

void EntryBatch::begin(std::uint64_t realtime) {
  entries.push_back({realtime, bytes.size(), {}});
}

void EntryBatch::add(JournalField field, std::string_view value) {
  auto& span = entries.back().values[indexOf(field)];
  if (span.start == std::string::npos) {
    span = {bytes.size(), value.size()};
    bytes.append(value);
  }
}

void EntryBatch::dropLast() {
  bytes.resize(entries.back().start);
  entries.pop_back();
}

void EntryBatch::clear() {
  bytes.clear();
  if (bytes.capacity() > 2 * kFullBytes) {
    bytes.shrink_to_fit();
  }
  entries.clear();
}

bool EntryBatch::isFull() const {
  return entries.size() >= kFullEntries || bytes.size() >= kFullBytes;
}

std::optional<std::string_view> EntryBatch::valueOf(std::size_t entry, JournalField field) const {
  const auto& span = entries[entry].values[indexOf(field)];
  if (span.start == std::string::npos) {
    return std::nullopt;
  }
  return std::string_view(bytes).substr(span.start, span.length);
}

JournalValues EntryBatch::valuesOf(std::size_t entry) const {
  JournalValues values;
  for (std::size_t field = 0; field < values.size(); ++field) {
    values[field] = valueOf(entry, static_cast<JournalField>(field));
  }
  return values;
}
