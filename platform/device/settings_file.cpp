#include "platform/device/settings_file.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <iterator>
#include <sstream>
#include <string_view>
#include <system_error>
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
    file.faults.push_back({line, "not a KEY=value line"});
    return;
  }
  auto value = readValue(text.substr(equals + 1));
  if (!value) {
    file.faults.push_back({line, std::string(key) + ": value is not quoted as it must be"});
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
  const auto unreadable = [](const char* why) {
    SettingsFile file;
    file.faults.push_back({0, why});
    return file;
  };
  std::error_code error;
  const auto status = std::filesystem::status(path, error);
  if (status.type() == std::filesystem::file_type::not_found) {
    return std::nullopt;
  }
  // Anything else than a file might never come to its end.
  if (std::filesystem::exists(status) && !std::filesystem::is_regular_file(status)) {
    return unreadable("not a file");
  }
  const std::ifstream stream(path, std::ios::binary);
  if (!stream) {
    return unreadable(std::strerror(errno));
  }
  std::ostringstream text;
  errno = 0;
  text << stream.rdbuf();
  if (errno != 0) {
    return unreadable(std::strerror(errno));
  }
  return parse(text.str());
}
