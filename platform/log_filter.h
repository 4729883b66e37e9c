#pragma once

#include <string>
#include <vector>

/// One comparison of an entry's field with a text. A field that the entry lacks compares false. A
/// text that is not valid UTF-8 is compared as it reads with U+FFFD for each broken sequence, which
/// is how entries show such bytes too.
struct LogComparison {
  enum class Kind {
    ProcessEquals,            ///< `process` is exactly `text`, case included.
    SenderImagePathContains,  ///< `senderImagePath` holds `text`, case and diacritics ignored.
  };

  Kind kind = Kind::ProcessEquals;
  std::string text;

  bool operator==(const LogComparison&) const = default;
};

/// A disjunction: an entry passes when any one comparison holds. It is a list that a reader can see
/// into, so that it can ask an index first.
using LogFilter = std::vector<LogComparison>;
