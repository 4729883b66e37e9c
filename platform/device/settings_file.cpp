#include "platform/device/settings_file.h"

#include "platform/posix/read_file.h"

#include <cerrno>
#include <cstring>
#include <sstream>
#include <string_view>
#include <utility>

namespace {

constexpr const char* kBlanks = " \t\r\v\f";

/// What a backslash takes the meaning of within double quotes, as in the shell.
constexpr std::string_view kEscaped = "\"\\$`";

/// What stands for itself only within quotes.
constexpr std::string_view kNeedsQuotes = "\"'\\ \t$`;&|<>()*?[]#~";

std::string_view trim(std::string_view text) {
  const auto first = text.find_first_not_of(kBlanks);
  if (first == std::string_view::npos) {
    return {};
  }
  return text.substr(first, text.find_last_not_of(kBlanks) - first + 1);
}

bool isKey(std::string_view word) {
  constexpr const char* kKeyCharacters =
      "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_.";
  return !word.empty() && word.find_first_not_of(kKeyCharacters) == std::string_view::npos;
}

/// The value between `quote` characters; empty when the closing one is not the last character.
std::optional<std::string> unquote(std::string_view text, char quote) {
  std::string value;
  for (std::size_t at = 1; at < text.size(); ++at) {
    const char character = text[at];
    if (character == quote) {
      return at + 1 == text.size() ? std::optional(value) : std::nullopt;
    }
    const bool escapes = quote == '"' && character == '\\' && at + 1 < text.size() &&
                         kEscaped.find(text[at + 1]) != std::string_view::npos;
    value += escapes ? text[++at] : character;
  }
  return std::nullopt;
}

std::optional<std::string> readValue(std::string_view text) {
  if (!text.empty() && (text.front() == '"' || text.front() == '\'')) {
    return unquote(text, text.front());
  }
  if (text.find_first_of(kNeedsQuotes) != std::string_view::npos) {
    return std::nullopt;
  }
  return std::string(text);
}

void parseLine(std::string_view text, int line, SettingsFile& file) {
  text = trim(text);
  if (text.empty() || text.front() == '#') {
    return;
  }
  const auto equals = text.find('=');
  const auto key = text.substr(0, equals);
  if (equals == std::string_view::npos || !isKey(key)) {
    file.addFault(line, "not a KEY=value line");
    return;
  }
  auto value = readValue(text.substr(equals + 1));
  if (!value) {
    file.addFault(line, std::string(key) + ": value is not quoted as it must be");
    file.settings.erase(std::string(key));
    return;
  }
  file.settings[std::string(key)] = {*std::move(value), line};
}

}  // namespace

SettingsFile SettingsFile::parse(const std::string& text) {
  SettingsFile file;
  std::istringstream lines(text);
  std::string lineText;
  for (int line = 1; std::getline(lines, lineText); ++line) {
    parseLine(lineText, line, file);
  }
  return file;
}

std::optional<SettingsFile> SettingsFile::read(const std::filesystem::path& path) {
  constexpr std::size_t kLargest = 1024UL * 1024;
  std::string text;
  const int error = readRegularFile(path, kLargest + 1, text);
  if (error == ENOENT || error == ENOTDIR) {
    return std::nullopt;
  }
  if (error == 0 && text.size() <= kLargest) {
    return parse(text);
  }
  SettingsFile file;
  file.addFault(0, error == 0        ? "larger than 1 MiB"
                   : error == EINVAL ? "not a file"
                                     : std::strerror(error));
  return file;
}

void SettingsFile::addFault(int line, std::string what) {
  constexpr std::size_t kMostTold = 20;
  if (++faultCount > kMostTold) {
    faults.resize(kMostTold);
    line = 0;
    what = std::to_string(faultCount) + " faults in all";
  }
  faults.push_back({line, std::move(what)});
}
