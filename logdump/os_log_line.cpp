#include "logdump/os_log_line.h"

#include <charconv>
#include <cstdint>
#include <optional>
#include <string_view>

namespace {

template <typename Number>
void appendNumber(std::string& line, Number number, std::size_t width, int base = 10) {
  char digits[24];
  const auto* const end = std::to_chars(std::begin(digits), std::end(digits), number, base).ptr;
  const auto length = static_cast<std::size_t>(end - digits);
  line.append(length < width ? width - length : 0, '0').append(digits, length);
}

void appendTime(std::string& line, LogTime time) {
  const auto day = std::chrono::floor<std::chrono::days>(time);
  const std::chrono::year_month_day date(day);
  const std::chrono::hh_mm_ss clock(std::chrono::floor<std::chrono::seconds>(time - day));
  appendNumber(line, static_cast<int>(date.year()), 4);
  line += '-';
  appendNumber(line, static_cast<unsigned>(date.month()), 2);
  line += '-';
  appendNumber(line, static_cast<unsigned>(date.day()), 2);
  line += ' ';
  appendNumber(line, clock.hours().count(), 2);
  line += ':';
  appendNumber(line, clock.minutes().count(), 2);
  line += ':';
  appendNumber(line, clock.seconds().count(), 2);
  line += " +0000";
}

LogTime localTime(const LogEntry& entry) {
  return entry.time +
         entry.timeZone->offsetAt(std::chrono::floor<std::chrono::seconds>(entry.time));
}

void appendText(std::string& line, std::optional<std::string_view> text) {
  line += text.value_or("(null)");
}

}  // namespace

std::string formatOsLogLine(const LogEntry& entry) {
  constexpr std::size_t kThreadWidth = 5;
  std::string line;
  line.reserve(256 + entry.composedMessage.value_or("").size());
  appendTime(line, localTime(entry));
  line += " 0x";
  appendNumber(line, entry.threadIdentifier, kThreadWidth, 16);
  line += " 0x";
  appendNumber(line, entry.activityIdentifier, 1, 16);
  line += ' ';
  appendNumber(line, entry.processIdentifier, 1);
  line += ' ';
  appendText(line, entry.process);
  line += '(';
  appendText(line, entry.sender);
  line += "):";
  appendText(line, entry.subsystem);
  line += " [";
  appendText(line, entry.category);
  line += "] ";
  appendText(line, entry.composedMessage);
  line += '\n';
  return line;
}
