#pragma once

#include "platform/journal/log_selection.h"

#include <systemd/sd-journal.h>

#include <optional>
#include <string>
#include <vector>

/// What the index of a journal has to say on `selection`, which is not everything: exact matches
/// ("FIELD=value", see sd_journal_add_match(3)) of which every selected entry has at least one.
/// Others may have one, too, so that entries that match are still to be asked one by one. Matches
/// of one field follow each other. None at all: nothing is selected. Empty when the index cannot
/// tell.
std::optional<std::vector<std::string>> findIndexMatches(sd_journal* journal,
                                                         const LogSelection& selection);
