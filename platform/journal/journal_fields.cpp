#include "platform/journal/journal_fields.h"

#include <algorithm>

namespace {

constexpr std::size_t kLongestName =
    std::max_element(kJournalFieldNames.begin(), kJournalFieldNames.end(),
                     [](auto left, auto right) { return left.size() < right.size(); }) -> size();

/// The fields whose names have the same length.
struct Candidates {
  std::array<JournalField, 2> fields{};
  std::size_t count = 0;
};

/// Every item of every entry is looked up. The length alone tells most names apart.
constexpr auto kFieldsByLength = [] {
  std::array<Candidates, kLongestName + 1> fieldsByLength{};
  for (std::size_t field = 0; field < kJournalFieldNames.size(); ++field) {
    auto& candidates = fieldsByLength.at(kJournalFieldNames.at(field).size());
    candidates.fields.at(candidates.count++) = static_cast<JournalField>(field);
  }
  return fieldsByLength;
}();

}  // namespace

std::optional<JournalField> findJournalField(std::string_view name) {
  if (name.size() > kLongestName) {
    return std::nullopt;
  }
  const auto& candidates = kFieldsByLength[name.size()];
  for (std::size_t at = 0; at < candidates.count; ++at) {
    if (kJournalFieldNames[indexOf(candidates.fields[at])] == name) {
      return candidates.fields[at];
    }
  }
  return std::nullopt;
}

std::string_view lastComponent(std::string_view path) {
  // Without a slash this starts at npos + 1, which is 0.
  return path.substr(path.rfind('/') + 1);
}

std::optional<std::string_view> processOf(const JournalValues& values) {
  if (const auto& executable = values[indexOf(JournalField::Executable)]) {
    return lastComponent(*executable);
  }
  const auto& commandName = values[indexOf(JournalField::CommandName)];
  return commandName ? commandName : values[indexOf(JournalField::SyslogIdentifier)];
}

std::optional<std::string_view> senderImagePathOf(const JournalValues& values) {
  const auto& told = values[indexOf(JournalField::SenderImagePath)];
  return told ? told : values[indexOf(JournalField::Executable)];
}
