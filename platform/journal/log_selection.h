#pragma once

#include "platform/journal/journal_fields.h"
#include "platform/log_filter.h"

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

/// A filter made ready to be asked about many entries: what a comparison costs is paid once for
/// each distinct text. Texts are given as they are stored, that is, not always valid UTF-8. Used on
/// one thread.
class LogSelection {
 public:
  /// Without a filter everything is selected.
  explicit LogSelection(const std::optional<LogFilter>& filter);

  /// Whether an entry is selected.
  [[nodiscard]] bool selects(const JournalValues& values) const;

  /// Whether everything is selected.
  [[nodiscard]] bool isEverything() const { return everything; }

  [[nodiscard]] bool selectsProcess(std::string_view process) const;
  [[nodiscard]] bool selectsImagePath(std::string_view imagePath) const;

 private:
  struct Hash : std::hash<std::string_view> {
    using is_transparent = void;
  };

  [[nodiscard]] bool containsPathText(std::string_view imagePath) const;

  bool everything;
  std::unordered_set<std::string, Hash, std::equal_to<>> names;  ///< Valid UTF-8.
  std::vector<std::string> pathTexts;                            ///< Folded.
  mutable std::unordered_map<std::string, bool, Hash, std::equal_to<>> pathVerdicts;
};
