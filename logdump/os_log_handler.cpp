#include "logdump/handlers.h"
#include "logdump/os_log_stream.h"

#include <algorithm>
#include <cstdlib>
#include <iostream>
#include <limits>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace {

struct Selection {
  std::vector<std::string> processes;
  std::vector<std::string> imagePaths;
};

Selection defaultSelection() {
  return {{"Linkward", "LinkwardMobileHelper", "LinkwardRootHelper", "vell-helper", "Airgroved",
           "Tessfield", "voltkeeperd"},
          {"HaldenBaseband"}};
}

/// Sorts the words into the list that the option before them names; those that no option, or an
/// unknown one, stands before are dropped.
Selection readSelection(std::list<std::string> words) {
  Selection selection;
  std::vector<std::string>* current = nullptr;
  for (auto& word : words) {
    if (word.starts_with('-')) {
      current = word == "-p"   ? &selection.processes
                : word == "-i" ? &selection.imagePaths
                               : nullptr;
    } else if (current != nullptr) {
      current->push_back(std::move(word));
    }
  }
  return selection;
}

/// The number at the start of `word`, 0 without one; one too large for an int is the largest.
int readHistory(const std::string& word) {
  constexpr long kLeast = std::numeric_limits<int>::min();
  constexpr long kMost = std::numeric_limits<int>::max();
  return static_cast<int>(std::clamp(std::strtol(word.c_str(), nullptr, 10), kLeast, kMost));
}

std::string takeFirst(std::list<std::string>& words) {
  auto first = std::move(words.front());
  words.pop_front();
  return first;
}

bool exportOsLog(std::list<std::string> words) {
  constexpr std::size_t kFewestWords = 2;
  if (words.size() < kFewestWords) {
    std::cout << "os log collection: Failed" << std::endl;
    return false;
  }
  const int history = readHistory(takeFirst(words));
  auto path = takeFirst(words);
  auto selection = words.empty() ? defaultSelection() : readSelection(std::move(words));
  return OsLogStream::putOsLogStreamToFile(std::move(path), std::move(selection.processes),
                                           std::move(selection.imagePaths), history);
}

}  // namespace

CommandHandler makeOsLogHandler() {
  return [](WorkGroup group, std::list<std::string> args) {
    std::optional<WorkGroup::Membership> membership;
    if (group) {
      membership.emplace(std::move(group));
    }
    return exportOsLog(std::move(args));
  };
}
