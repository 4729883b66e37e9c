#include "platform/journal/log_selection.h"

#include "platform/unicode/folded_text.h"
#include "platform/unicode/utf8.h"

#include <algorithm>

namespace {

/// Programs name their own image path, so they can make up any number: these bound the memory.
constexpr std::size_t kMostVerdicts = 4096;
constexpr std::size_t kLongestKnownPath = 4096;

}  // namespace

LogSelection::LogSelection(const std::optional<LogFilter>& filter) : everything(!filter) {
  for (const auto& comparison : filter.value_or(LogFilter())) {
    auto text = validUtf8(comparison.text);
    if (comparison.kind == LogComparison::Kind::ProcessEquals) {
      names.insert(std::move(text));
    } else {
      pathTexts.push_back(foldedText(text));
    }
  }
}

bool LogSelection::selects(const JournalValues& values) const {
  if (everything) {
    return true;
  }
  const auto process = processOf(values);
  const auto imagePath = senderImagePathOf(values);
  return (process && selectsProcess(*process)) || (imagePath && selectsImagePath(*imagePath));
}

bool LogSelection::selectsProcess(std::string_view process) const {
  return isValidUtf8(process) ? names.contains(process) : names.contains(validUtf8(process));
}

bool LogSelection::selectsImagePath(std::string_view imagePath) const {
  if (pathTexts.empty()) {
    return false;
  }
  if (const auto known = pathVerdicts.find(imagePath); known != pathVerdicts.end()) {
    return known->second;
  }
  if (imagePath.size() > kLongestKnownPath) {
    return containsPathText(imagePath);
  }
  if (pathVerdicts.size() >= kMostVerdicts) {
    pathVerdicts.clear();
  }
  return pathVerdicts.emplace(imagePath, containsPathText(imagePath)).first->second;
}

bool LogSelection::containsPathText(std::string_view imagePath) const {
  const auto path = foldedText(validUtf8(imagePath));
  return std::any_of(pathTexts.begin(), pathTexts.end(),
                     [&](const std::string& text) { return path.find(text) != std::string::npos; });
}
