#include "simulator/options.h"

#include "simulator/complaint.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace simulator {

namespace {

constexpr const char* kUsage =
    "usage: vell-simulator [PROFILE] [-- COMMAND...] | --serve bus|manager|helper|journal "
    "[LOGFILE]";

std::optional<Options> refuse(const std::string& what) {
  complain(what + "; " + kUsage);
  return std::nullopt;
}

std::optional<Options> parseService(const std::vector<std::string>& words) {
  constexpr const char* kServices[] = {"bus", "manager", "helper", "journal"};
  if (words.size() < 2 || words.size() > 3) {
    return refuse("--serve takes a service and perhaps a file");
  }
  if (std::find(std::begin(kServices), std::end(kServices), words[1]) == std::end(kServices)) {
    return refuse("no service is called \"" + words[1] + "\"");
  }
  Options options;
  options.service = words[1];
  options.requestLog = words.size() == 3 ? words[2] : "";
  return options;
}

}  // namespace

std::optional<Options> parseOptions(const std::vector<std::string>& words) {
  if (!words.empty() && words.front() == "--serve") {
    return parseService(words);
  }
  const auto separator = std::find(words.begin(), words.end(), "--");
  if (separator - words.begin() > 1) {
    return refuse("more than one profile");
  }
  Options options;
  if (separator != words.begin()) {
    options.profile = words.front();
    if (options.profile.empty() || options.profile.front() == '-') {
      return refuse("\"" + options.profile + "\" is no profile");
    }
  }
  if (separator != words.end()) {
    options.command.assign(std::next(separator), words.end());
    if (options.command.empty()) {
      return refuse("no command after --");
    }
  }
  return options;
}

}  // namespace simulator
