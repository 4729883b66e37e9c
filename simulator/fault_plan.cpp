#include "simulator/fault_plan.h"

#include "simulator/profile_reader.h"

#include <algorithm>
#include <iterator>
#include <limits>
#include <sstream>
#include <string_view>

namespace simulator {

namespace {

struct ConductWord {
  std::string_view word;
  Conduct conduct;
};

constexpr ConductWord kConductWords[] = {
    {"answer", Conduct::Reply},    {"wrong-signature", Conduct::WrongSignature},
    {"silent", Conduct::Silent},   {"die", Conduct::Die},
    {"restart", Conduct::Restart},
};

constexpr std::string_view kStatus = "status:";
constexpr std::string_view kSlow = "slow:";
constexpr std::chrono::milliseconds kLongestDelay = std::chrono::hours(24);

/// The number after `prefix` in `word`, where there is one between `lowest` and `highest`.
std::optional<std::int64_t> numberAfter(std::string_view prefix, const std::string& word,
                                        std::int64_t lowest, std::int64_t highest) {
  const auto number =
      word.starts_with(prefix) ? parseInteger(word.substr(prefix.size())) : std::nullopt;
  return number && *number >= lowest && *number <= highest ? number : std::nullopt;
}

bool applyWord(const std::string& word, FaultPlan& plan) {
  const auto* const known =
      std::find_if(std::begin(kConductWords), std::end(kConductWords),
                   [&](const ConductWord& entry) { return entry.word == word; });
  if (known != std::end(kConductWords)) {
    plan.conduct = known->conduct;
    return true;
  }
  if (word == "no-dictionary") {
    plan.noDictionary = true;
    return true;
  }
  if (const auto status = numberAfter(kStatus, word, std::numeric_limits<std::int32_t>::min(),
                                      std::numeric_limits<std::uint32_t>::max())) {
    plan.status = static_cast<std::int32_t>(static_cast<std::uint32_t>(*status));
    return true;
  }
  if (const auto delay = numberAfter(kSlow, word, 0, kLongestDelay.count())) {
    plan.delay = std::chrono::milliseconds(*delay);
    return true;
  }
  return false;
}

}  // namespace

std::optional<FaultPlan> parseFaultPlan(const std::string& text) {
  FaultPlan plan;
  std::istringstream words(text);
  for (std::string word; words >> word;) {
    if (!applyWord(word, plan)) {
      return std::nullopt;
    }
  }
  return plan;
}

}  // namespace simulator
