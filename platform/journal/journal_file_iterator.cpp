// The walk through one journal file.
//
//                  start                advance            advance
//     Waiting ------+------> Walking ------------> AtEnd ----------> Closed
//                   |           |  no entry left, or damaged           ^
//                   |           +--------------------------------------+
//                   +--- no entry from `earliest` on, or none selected +
//
// The end. A live file grows while it is read. Its end is therefore fixed at the start: the cursor
// of the entry that is the last one then. With an index the end is the last entry that matches,
// which saves the walk to the end of the file. Only a plain walk through a file that is not live
// needs no end in advance: it ends where the library has no next entry.
//
// The index. The library steps either by its index (matches are set) or plainly (none are), and can
// change between the two at any entry. `JournalIndex` chooses. Entries that match are a superset of
// those that are selected, so the caller checks each entry in either case.
//
// Damage. The library reports little of it: it drops a file that it finds damaged and goes on as if
// that had ended. So each end is checked against a second account of it:
//   - with an index: the entry that was last when the walk started is the one the walk ends at, and
//     the index has nothing behind it;
//   - in a live file: the entry that the header names as last is not newer than the one found;
//   - in any other: the last entry has the time that the header names;
//   - always: the library still has the file.
// That a page was lost is asked after each step.
// If an index fails the check, its file is opened again and walked plainly behind the entry that
// was reached. Whatever fails, the file's status says that entries may be missing, and why.
//
// Cost. A plain step is one entry of an array that the library has mapped. A step by the index
// costs 0.3 of that more for each match. A cursor costs as much as reading an entry, so it is asked
// for only by a caller that needs it.

#include "platform/journal/journal_file_iterator.h"

#include "platform/journal/lost_pages.h"
#include "platform/process_end.h"

#include <algorithm>
#include <cerrno>
#include <string_view>
#include <utility>

namespace {

constexpr const char* kWhole = "";
constexpr const char* kEndsEarly = "ends before its last entry";

void addItem(std::string_view item, EntryBatch& batch) {
  const auto equals = item.find('=');
  if (const auto field = findJournalField(item.substr(0, equals))) {
    batch.add(*field, item.substr(equals + 1));
  }
}

/// When the last entry was stored, by the file's header. A live file's may be newer than the end of
/// the walk.
std::uint64_t timeOfLast(sd_journal* journal) {
  std::uint64_t first = 0;
  std::uint64_t last = 0;
  return sd_journal_get_cutoff_realtime_usec(journal, &first, &last) > 0 ? last : 0;
}

}  // namespace

JournalFileIterator::JournalFileIterator(JournalFile journalFile, std::uint64_t from)
    : file(std::move(journalFile)), earliest(from), latest(std::max(file.stored.first, from)) {}

void JournalFileIterator::start(const LogSelection& selection) {
  if (!open()) {
    close(whyNotOpened(errno, file.file).c_str());
    return;
  }
  // By its header. What is added meanwhile is newer.
  const auto last = timeOfLast(journal.get());
  if (file.isLive && (!fixEnd() || last > end.realtime)) {
    note(kEndsEarly);
  }
  const auto answer = askIndex(selection);
  if (answer == Answer::Damaged) {
    goOnWithoutIndex(0);
  } else if (answer == Answer::NoneSelected || (!end.cursor.empty() && end.realtime < earliest)) {
    close(kWhole);
  } else if (!goToFirst()) {
    close(timeOfLast(journal.get()) < earliest ? kWhole : kEndsEarly);
  }
  lostPage();
}

/// Opens the journal, or opens it again.
bool JournalFileIterator::open() {
  journal = openJournal(file.file.duplicate());
  return journal != nullptr;
}

/// Fixes the last entry that the library can step to now as the end.
bool JournalFileIterator::fixEnd() {
  if (sd_journal_seek_tail(journal.get()) < 0 || sd_journal_previous(journal.get()) <= 0 ||
      sd_journal_get_realtime_usec(journal.get(), &end.realtime) < 0) {
    return false;
  }
  end.cursor = cursorOf(journal.get());
  return !end.cursor.empty();
}

/// Looks up `selection` in the index, and fixes the end by it. The index of a file that was not
/// closed in good order may lack entries. What damaged the end of a file may have damaged its
/// index.
JournalFileIterator::Answer JournalFileIterator::askIndex(const LogSelection& selection) {
  const bool trusted = file.wasClosed && file.status.isWhole() && !selection.isEverything();
  auto matches = trusted ? findIndexMatches(journal.get(), selection) : std::nullopt;
  if (!hasJournalFile(journal.get())) {
    return Answer::Damaged;
  }
  if (!matches || matches->empty()) {
    return matches ? Answer::NoneSelected : Answer::Walk;
  }
  index = JournalIndex(std::move(*matches));
  if (!index.enable(journal.get())) {
    index = JournalIndex();
    return Answer::Walk;
  }
  // An index that lists values which no entry has is damaged.
  const bool found = fixEnd();
  index.disable(journal.get());
  return found ? Answer::Walk : Answer::Damaged;
}

/// Adds an entry with the items of the current one. Returns 0, or the library's failure.
int JournalFileIterator::readItems(EntryBatch& batch) {
  const void* data = nullptr;
  std::size_t length = 0;
  int more = 0;
  batch.begin(current);
  sd_journal_restart_data(journal.get());
  while ((more = sd_journal_enumerate_data(journal.get(), &data, &length)) > 0) {
    addItem({static_cast<const char*>(data), length}, batch);
  }
  return more;
}

bool JournalFileIterator::read(EntryBatch& batch) {
  int more = readItems(batch);
  if (more == -ENOMEM) {
    // This comes of a damaged compressed value, too.
    endWithoutMemory();
    batch.dropLast();
    more = readItems(batch);
  }
  const bool whole = !lostPage() && more == 0;
  if (!whole) {
    batch.dropLast();
    note("has a damaged entry");
  }
  return whole;
}

void JournalFileIterator::advance(bool selected) {
  const auto left = current;
  if (state == State::AtEnd) {
    if (!index.isUsed() || isEndOfIndex()) {
      close(kWhole);
      return;
    }
  } else {
    index.chooseNextStep(journal.get(), selected);
    const bool found = goToNext();
    if (!lostPage() && found) {
      return;
    }
  }
  if (index.isUsed()) {
    goOnWithoutIndex(left);
  } else {
    close(isEndOfFile() ? kWhole : kEndsEarly);
  }
}

/// Whether the index has nothing behind the entry that it named as its last, as far as that can be
/// told in a live file.
bool JournalFileIterator::isEndOfIndex() {
  const bool found = index.enable(journal.get()) && sd_journal_next(journal.get()) > 0;
  return hasJournalFile(journal.get()) && (file.isLive || !found);
}

/// Whether a plain walk that has no next entry is at the end of the file, rather than at a damaged
/// place. Says no in a live file, whose end is known in advance.
bool JournalFileIterator::isEndOfFile() {
  return !file.isLive && hasJournalFile(journal.get()) && current == timeOfLast(journal.get());
}

bool JournalFileIterator::goToFirst() {
  return sd_journal_seek_realtime_usec(journal.get(), earliest) >= 0 && goToNext();
}

bool JournalFileIterator::goToNext() {
  if (checked(sd_journal_next(journal.get())) <= 0 ||
      sd_journal_get_realtime_usec(journal.get(), &current) < 0) {
    return false;
  }
  latest = std::max(latest, current);
  const bool isLast = current == end.realtime &&
                      checked(sd_journal_test_cursor(journal.get(), end.cursor.c_str())) > 0;
  state = isLast ? State::AtEnd : State::Walking;
  return true;
}

/// Gives up a damaged index: it cannot be asked, or ends elsewhere than it said before. Walks
/// plainly to the first entry after the time `left`, from the start: seeking a time uses an index
/// too.
void JournalFileIterator::goOnWithoutIndex(std::uint64_t left) {
  index = JournalIndex();
  end = End();
  bool found = open() && (!file.isLive || fixEnd()) && goToFirst();
  while (found && current <= left) {
    found = state == State::Walking && goToNext();
  }
  if (found) {
    note("its index contradicts itself");
  } else {
    close(kEndsEarly);
  }
}

void JournalFileIterator::close(const char* cause) {
  note(cause);
  if (!hasJournalFile(journal.get())) {
    note(kEndsEarly);
  }
  state = State::Closed;
  index = JournalIndex();
  end = End();
  journal.reset();
  file.file = FileDescriptor();
}

/// Notes why entries are or may be missing. That a page was lost explains whatever else is found.
void JournalFileIterator::note(const char* cause) {
  lostPage();
  file.status.note(cause);
}

/// Whether a page of the file was lost since this was asked last; notes it.
bool JournalFileIterator::lostPage() {
  const bool lost = hasLostPage();
  if (lost) {
    file.status.note(kLostPage);
  }
  return lost;
}
