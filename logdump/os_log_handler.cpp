#include "logdump/handlers.h"
#include "logdump/os_log_stream.h"
#include "platform/telephony.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <iostream>
#include <iterator>
#include <limits>
#include <optional>
#include <set>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

namespace {

constexpr std::size_t kFewestWords = 2;

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

/// The paths of files that begin with `typed`; a slash ends that of a folder.
std::set<std::string> filesAt(const std::string& typed) {
  const auto folder = typed.substr(0, typed.rfind('/') + 1);
  std::set<std::string> files;
  std::error_code error;
  for (std::filesystem::directory_iterator entry(folder.empty() ? "." : folder, error), end;
       !error && entry != end; entry.increment(error)) {
    files.insert(folder + entry->path().filename().string() +
                 (entry->is_directory(error) ? "/" : ""));
  }
  return files;
}

}  // namespace

std::set<std::string> completeOsLogArgs(const std::list<std::string>& before,
                                        const std::string& typed) {
  if (before.size() < kFewestWords) {
    return before.empty() ? std::set<std::string>() : filesAt(typed);
  }
  std::string option;
  for (auto word = std::next(before.begin(), kFewestWords); word != before.end(); ++word) {
    option = word->starts_with('-') ? *word : option;
  }
  if (typed.starts_with('-') || (option != "-p" && option != "-i")) {
    return {"--", "-i", "-p"};
  }
  return option == "-p" ? processNames() : filesAt(typed);
}

CommandHandler makeOsLogHandler() {
  return [](WorkGroup group, std::list<std::string> args) {
    std::optional<WorkGroup::Membership> membership;
    if (group) {
      membership.emplace(std::move(group));
    }
    return exportOsLog(std::move(args));
  };
}
