#include "platform/linux/journal/journal_file_scan.h"

#include "platform/linux/journal/journal_index.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace {

struct CharactersReleaser {
  void operator()(char* characters) const { std::free(characters); }
};

void addItem(std::string_view item, EntryBatch& batch) {
  const auto equals = item.find('=');
  if (const auto field = findJournalField(item.substr(0, equals))) {
    batch.add(*field, item.substr(equals + 1));
  }
}

/// When the last entry was stored; it may be one that was added just now.
std::uint64_t timeOfLast(sd_journal* journal) {
  std::uint64_t first = 0;
  std::uint64_t last = 0;
  return sd_journal_get_cutoff_realtime_usec(journal, &first, &last) > 0 ? last : 0;
}

/// Restricts the journal to entries that have one of `matches`. The library takes those of one
/// field for alternatives, and is told that the fields are.
bool addMatches(sd_journal* journal, const std::vector<std::string>& matches) {
  std::string_view lastName;
  return std::all_of(matches.begin(), matches.end(), [&](const std::string& match) {
    const auto name = std::string_view(match).substr(0, match.find('='));
    const bool sameField = std::exchange(lastName, name) == name;
    return (sameField || sd_journal_add_disjunction(journal) >= 0) &&
           sd_journal_add_match(journal, match.data(), match.size()) >= 0;
  });
}

}  // namespace

JournalFileScan::JournalFileScan(JournalFile file, LogTime from)
    : journal(std::move(file.journal)),
      earliest(
          static_cast<std::uint64_t>(std::max<LogTime::rep>(from.time_since_epoch().count(), 0))) {
  std::uint64_t first = 0;
  std::uint64_t last = 0;
  const int found = sd_journal_get_cutoff_realtime_usec(journal.get(), &first, &last);
  currentRealtime = std::max(first, earliest);
  if (found == 0 || (found > 0 && last < earliest)) {
    close(true);
  }
}

void JournalFileScan::start(const LogSelection& selection) {
  started = true;
  damaged = !isTailReadable();
  const bool mayHaveAny = selection.isEverything() || useIndex(selection);
  if (mayHaveAny && findEnd() && endRealtime >= earliest && seekStart()) {
    advance();
  } else {
    close(true);
  }
}

/// Whether the library finds the last entry that the file has by its own account, and not, in a
/// file that is damaged there, an earlier one.
bool JournalFileScan::isTailReadable() {
  const auto lastBefore = timeOfLast(journal.get());
  std::uint64_t found = 0;
  if (sd_journal_seek_tail(journal.get()) < 0 || sd_journal_previous(journal.get()) <= 0 ||
      sd_journal_get_realtime_usec(journal.get(), &found) < 0) {
    return false;
  }
  // Entries may have been added meanwhile.
  return found == lastBefore || (found > lastBefore && found <= timeOfLast(journal.get()));
}

/// Restricts the walk to what the index finds. False when it finds that there is nothing.
bool JournalFileScan::useIndex(const LogSelection& selection) {
  const auto matches = findIndexMatches(journal.get(), selection);
  if (matches && matches->empty()) {
    return false;
  }
  if (matches && isIndexWorthwhile(matches->size(), selection) &&
      !addMatches(journal.get(), *matches)) {
    sd_journal_flush_matches(journal.get());
  }
  return true;
}

/// With the index a step costs about 0.3 of a plain one for each match, and without it there is a
/// step for each entry that is not selected. How many those are shows in the first entries.
bool JournalFileScan::isIndexWorthwhile(std::size_t matches, const LogSelection& selection) {
  constexpr std::size_t kAlwaysWorthwhile = 3;
  constexpr std::size_t kSample = 50;
  if (matches <= kAlwaysWorthwhile || !seekStart()) {
    return true;
  }
  std::size_t selected = 0;
  EntryBatch sample;
  while (sample.size() < kSample && sd_journal_next(journal.get()) > 0 && read({}, sample)) {
    selected += selection.selects(sample.valuesOf(sample.size() - 1)) ? 1 : 0;
  }
  return selected * (10 + 3 * matches) < sample.size() * 10;
}

/// Notes which entry is the last of the walk.
bool JournalFileScan::findEnd() {
  if (sd_journal_seek_tail(journal.get()) < 0 || sd_journal_previous(journal.get()) <= 0 ||
      sd_journal_get_realtime_usec(journal.get(), &endRealtime) < 0) {
    return false;
  }
  endCursor = cursor();
  damaged = damaged || endCursor.empty();
  return !endCursor.empty();
}

bool JournalFileScan::seekStart() {
  return (earliest == 0 ? sd_journal_seek_head(journal.get())
                        : sd_journal_seek_realtime_usec(journal.get(), earliest)) >= 0;
}

std::string JournalFileScan::cursor() const {
  char* text = nullptr;
  if (sd_journal_get_cursor(journal.get(), &text) < 0) {
    return {};
  }
  const std::unique_ptr<char, CharactersReleaser> owner(text);
  return text;
}

bool JournalFileScan::read(EntryBatch::Stamp stamp, EntryBatch& batch) {
  batch.begin(std::move(stamp));
  const void* data = nullptr;
  std::size_t length = 0;
  sd_journal_restart_data(journal.get());
  int more = sd_journal_enumerate_data(journal.get(), &data, &length);
  for (; more > 0; more = sd_journal_enumerate_data(journal.get(), &data, &length)) {
    addItem({static_cast<const char*>(data), length}, batch);
  }
  if (more < 0) {
    batch.dropLast();
    damaged = true;
  }
  return more == 0;
}

void JournalFileScan::advance() {
  if (atEnd) {
    close(true);
  } else if (sd_journal_next(journal.get()) <= 0 ||
             sd_journal_get_realtime_usec(journal.get(), &currentRealtime) < 0) {
    // The end is an entry of the file, and it was not reached.
    close(false);
  } else {
    atEnd = currentRealtime == endRealtime &&
            sd_journal_test_cursor(journal.get(), endCursor.c_str()) > 0;
  }
}

void JournalFileScan::close(bool complete) {
  damaged = damaged || !complete || !hasJournalFile(journal.get());
  journal.reset();
}
