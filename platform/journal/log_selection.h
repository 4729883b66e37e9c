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

/// A filter prepared for many entries: texts are folded once, and each distinct image path is
/// compared once. Takes texts as stored, which need not be valid UTF-8. On one thread.
class LogSelection {
 public:
  /// Without a filter every entry is selected.
  explicit LogSelection(const std::optional<LogFilter>& filter);

  /// Whether an entry with these values is selected.
  [[nodiscard]] bool selects(const JournalValues& values) const;

  /// Whether every entry is selected.
  [[nodiscard]] bool isEverything() const { return everything; }

  /// Whether an entry of that process is selected for it.
  [[nodiscard]] bool selectsProcess(std::string_view process) const;
  /// Whether an entry of that image path is selected for it.
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
