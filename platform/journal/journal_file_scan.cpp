#include "platform/journal/journal_file_scan.h"

#include "platform/journal/journal_index.h"
#include "platform/journal/lost_pages.h"
#include "platform/portable/handle.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace {

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

std::string cursorOf(sd_journal* journal) {
  char* text = nullptr;
  if (sd_journal_get_cursor(journal, &text) < 0) {
    return {};
  }
  const HandlePtr<char, std::free> owner(text);
  return text;
}

}  // namespace

JournalFileScan::JournalFileScan(JournalFile found, LogTime from)
    : file(std::move(found.file)),
      number(found.number),
      grows(found.grows),
      shared(found.shared),
      earliest(journalTime(from)),
      currentRealtime(found.stored.first),
      latestRealtime(currentRealtime),
      trusted(found.wasClosed) {}

void JournalFileScan::start(const LogSelection& selection) {
  started = true;
  const auto lostBefore = lostPages();
  damaged = !reopen() || (grows && !findEndOfFile());
  // What has damaged the file's end may have damaged its index.
  trusted = trusted && !damaged;
  const bool mayHaveAny = journal && (selection.isEverything() || findMatches(selection));
  // An index that lists values which no entry has is damaged.
  const bool usable = mayHaveAny && hasJournalFile(journal.get()) && (matches.empty() || findEnd());
  if (mayHaveAny && !usable) {
    goOnWithoutIndex(0);
  } else if (!mayHaveAny || (!endCursor.empty() && endRealtime < earliest)) {
    close(true);
  } else if (sd_journal_flush_matches(journal.get()); !seek(earliest) || !goToNext()) {
    close(timeOfLast(journal.get()) < earliest);
  }
  damaged = damaged || lostPages() != lostBefore;
}

/// Opens the file; it can be done again as long as there are file descriptors to be had.
bool JournalFileScan::reopen() {
  auto spare = file.duplicate();
  journal = openJournal(std::move(file));
  file = std::move(spare);
  return journal != nullptr;
}

/// Notes the last entry that the walk can come to as its end.
bool JournalFileScan::findEnd() {
  if (sd_journal_seek_tail(journal.get()) < 0 || sd_journal_previous(journal.get()) <= 0 ||
      sd_journal_get_realtime_usec(journal.get(), &endRealtime) < 0) {
    return false;
  }
  endCursor = cursorOf(journal.get());
  return !endCursor.empty();
}

/// Finds the end of the file. False when that is not the last entry that the file has by its own
/// account but, because the file is damaged there, an earlier one.
bool JournalFileScan::findEndOfFile() {
  const auto last = timeOfLast(journal.get());
  return findEnd() && last <= endRealtime;
}

/// Asks the index which entries may be selected, and restricts the journal to them. False when it
/// finds that there are none. The index of a file that was not closed in good order may lack some.
bool JournalFileScan::findMatches(const LogSelection& selection) {
  auto found = trusted ? findIndexMatches(journal.get(), selection) : std::nullopt;
  if (!found || !hasJournalFile(journal.get()) || !addMatches(journal.get(), *found)) {
    return true;
  }
  matches = std::move(*found);
  way = WayChoice(matches.size());
  return !matches.empty();
}

bool JournalFileScan::seek(std::uint64_t realtime) {
  return sd_journal_seek_realtime_usec(journal.get(), realtime) >= 0;
}

bool JournalFileScan::read(EntryBatch& batch) {
  // A cursor is slow to be had, and is there to tell the entries of one time from each other.
  batch.begin({currentRealtime, latestRealtime, number,
               shared.holds(currentRealtime) ? cursorOf(journal.get()) : std::string()});
  const auto lostBefore = lostPages();
  const void* data = nullptr;
  std::size_t length = 0;
  sd_journal_restart_data(journal.get());
  int more = sd_journal_enumerate_data(journal.get(), &data, &length);
  for (; more > 0; more = sd_journal_enumerate_data(journal.get(), &data, &length)) {
    addItem({static_cast<const char*>(data), length}, batch);
  }
  const bool whole = more == 0 && lostPages() == lostBefore;
  if (!whole) {
    batch.dropLast();
    damaged = true;
  }
  return whole;
}

void JournalFileScan::advance(bool selected) {
  const auto left = currentRealtime;
  const auto lostBefore = lostPages();
  if (atEnd && (matches.empty() || isEndOfIndex())) {
    close(true);
    return;
  }
  if (!atEnd) {
    chooseWay(selected);
    if (goToNext() && lostPages() == lostBefore) {
      return;
    }
  }
  if (!matches.empty()) {
    goOnWithoutIndex(left);
  } else {
    // One that does not grow, and whose end was not looked for, may simply be at it.
    close(!grows && lostPages() == lostBefore && hasJournalFile(journal.get()) &&
          currentRealtime == timeOfLast(journal.get()));
  }
}

/// Whether the index, too, has nothing after the entry that it named as its last, as far as that
/// can be told in a file that grows.
bool JournalFileScan::isEndOfIndex() {
  const bool asked = indexed || addMatches(journal.get(), matches);
  const bool found = asked && sd_journal_next(journal.get()) > 0;
  return hasJournalFile(journal.get()) && (grows || !found);
}

/// Has the next step go by the index, or to every entry, whichever is better here.
void JournalFileScan::chooseWay(bool selected) {
  way.noteStep(selected);
  if (way.isByIndex() != indexed) {
    indexed = !indexed && addMatches(journal.get(), matches);
    if (!indexed) {
      sd_journal_flush_matches(journal.get());
    }
  }
}

bool JournalFileScan::goToNext() {
  if (sd_journal_next(journal.get()) <= 0 ||
      sd_journal_get_realtime_usec(journal.get(), &currentRealtime) < 0) {
    return false;
  }
  latestRealtime = std::max(latestRealtime, currentRealtime);
  atEnd = currentRealtime == endRealtime &&
          sd_journal_test_cursor(journal.get(), endCursor.c_str()) > 0;
  return true;
}

/// The index is damaged: it cannot be asked, or ends elsewhere than it said before. What it does
/// not show after the time `left` is found by looking at every entry; to seek that time in the
/// file would need an index, too.
void JournalFileScan::goOnWithoutIndex(std::uint64_t left) {
  damaged = true;
  indexed = false;
  matches.clear();
  way = WayChoice(0);
  endRealtime = 0;
  bool found = reopen() && (!grows || findEnd()) && seek(earliest) && goToNext();
  while (found && currentRealtime <= left) {
    found = !atEnd && goToNext();
  }
  if (!found) {
    close(false);
  }
}

void JournalFileScan::close(bool complete) {
  damaged = damaged || !complete || !journal || !hasJournalFile(journal.get());
  open = false;
  journal.reset();
  file = FileDescriptor();
}
