#include "platform/journal/entry_decoder.h"

#include "platform/unicode/utf8.h"

#include <charconv>
#include <initializer_list>

namespace {

/// The journal itself takes a later time for damage.
constexpr std::uint64_t kEndOfTime = 1ULL << 55U;

/// The number in `digits`; nullopt unless all of them belong to it.
template <typename Number>
std::optional<Number> parseNumber(const std::optional<std::string_view>& digits, int base = 10) {
  if (!digits) {
    return std::nullopt;
  }
  Number number{};
  const auto* const end = digits->data() + digits->size();
  const auto read = std::from_chars(digits->data(), end, number, base);
  return read.ec == std::errc() && read.ptr == end ? std::optional(number) : std::nullopt;
}

std::optional<std::uint64_t> parseHexadecimal(std::optional<std::string_view> digits) {
  if (digits && (digits->starts_with("0x") || digits->starts_with("0X"))) {
    digits->remove_prefix(2);
  }
  return parseNumber<std::uint64_t>(digits, 16);
}

/// The number in the first of `fields` that holds one, else 0.
template <typename Number>
Number firstNumber(const JournalValues& values, std::initializer_list<JournalField> fields) {
  for (const auto field : fields) {
    if (const auto number = parseNumber<Number>(values[indexOf(field)])) {
      return *number;
    }
  }
  return 0;
}

std::optional<std::string_view> firstText(const JournalValues& values, JournalField first,
                                          JournalField second) {
  const auto& text = values[indexOf(first)];
  return text ? text : values[indexOf(second)];
}

std::optional<std::string_view> repair(std::optional<std::string_view> text, std::string& place) {
  if (!text || isValidUtf8(*text)) {
    return text;
  }
  place = validUtf8(*text);
  return place;
}

}  // namespace

LogTime entryTime(std::optional<std::string_view> sourceTime, std::uint64_t realtime) {
  const auto source = parseNumber<std::uint64_t>(sourceTime);
  const auto time = source && *source < kEndOfTime ? *source : realtime;
  return LogTime(std::chrono::microseconds(time));
}

LogEntry EntryDecoder::decode(const JournalValues& values, std::uint64_t realtime) {
  LogEntry entry;
  entry.type = values[indexOf(JournalField::Message)] ? kLogEntryMessage : 0;
  entry.time = entryTime(values[indexOf(JournalField::SourceTime)], realtime);
  entry.timeZone = &timeZone;
  entry.threadIdentifier =
      firstNumber<std::uint64_t>(values, {JournalField::ThreadId, JournalField::ProcessId});
  entry.activityIdentifier =
      parseHexadecimal(values[indexOf(JournalField::ActivityId)]).value_or(0);
  entry.processIdentifier =
      firstNumber<std::int32_t>(values, {JournalField::ProcessId, JournalField::SyslogProcessId});
  entry.process = repair(processOf(values), repaired[0]);
  entry.senderImagePath = repair(senderImagePathOf(values), repaired[1]);
  if (entry.senderImagePath) {
    entry.sender = lastComponent(*entry.senderImagePath);
  }
  entry.subsystem =
      repair(firstText(values, JournalField::Subsystem, JournalField::Unit), repaired[2]);
  entry.category = repair(firstText(values, JournalField::Category, JournalField::SyslogIdentifier),
                          repaired[3]);
  entry.composedMessage = repair(values[indexOf(JournalField::Message)], repaired[4]);
  return entry;
}
