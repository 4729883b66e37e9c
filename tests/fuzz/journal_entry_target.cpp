// A journal entry of any bytes to its line in an export, beside a plain model of the whole line.
//
// An input is the time of storing, in microseconds, and then fields, "NAME=value"; each field
// stands behind a record separator.

#include "logdump/os_log_line.h"
#include "platform/journal/entry_decoder.h"
#include "tests/fuzz/fuzz_target.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <ctime>
#include <initializer_list>
#include <map>
#include <type_traits>

namespace {

using Fields = std::map<std::string, std::string>;
using Names = std::initializer_list<const char*>;

constexpr std::uint64_t kEndOfTime = 1ULL << 55U;
constexpr std::time_t kZone = 2 * 3600L;

/// The length of the well-formed UTF-8 sequence that `bytes` start with; 0 when there is none.
std::size_t sequenceLength(std::string_view bytes) {
  const unsigned lead = static_cast<unsigned char>(bytes[0]);
  const std::size_t length = lead < 0x80   ? 1
                             : lead < 0xC2 ? 0
                             : lead < 0xE0 ? 2
                             : lead < 0xF0 ? 3
                                           : 4;
  std::uint32_t code = length == 1 ? lead : lead & (0xFFU >> (length + 1));
  for (std::size_t at = 1; at < length; ++at) {
    const unsigned next = at < bytes.size() ? static_cast<unsigned char>(bytes[at]) : 0;
    code = next >> 6U == 2 ? code << 6U | (next & 0x3FU) : UINT32_MAX >> 6U;
  }
  constexpr std::uint32_t kLeast[] = {UINT32_MAX, 0, 0x80, 0x800, 0x10000};
  const bool surrogate = code >> 11U == 0xD800 >> 11U;
  return lead > 0xF4 || code < kLeast[length] || code > 0x10FFFF || surrogate ? 0 : length;
}

/// The well-formed sequences of `bytes`, but for U+FFFD; `broken` counts the other bytes.
std::string wellFormed(std::string_view bytes, std::size_t& broken) {
  std::string text;
  while (!bytes.empty()) {
    const auto length = sequenceLength(bytes);
    broken += length == 0 ? 1 : 0;
    text += bytes.starts_with("\xEF\xBF\xBD") ? "" : bytes.substr(0, length);
    bytes.remove_prefix(std::max<std::size_t>(length, 1));
  }
  return text;
}

/// The first of the fields `names` that is there; of a path, its last component.
std::string textOf(const Fields& fields, Names names) {
  for (const std::string name : names) {
    if (const auto field = fields.find(name); field != fields.end()) {
      const bool path = name == "_EXE" || name == "VELL_SENDER_IMAGE_PATH";
      return path ? split(field->second, "/").back() : field->second;
    }
  }
  return "(null)";
}

/// The first of the fields `names` that is a number of at most `most`, after a minus one more.
template <typename Number>
Number numberOf(const Fields& fields, Names names, Number other, std::uint64_t most,
                int base = 10) {
  for (const std::string name : names) {
    const auto text = fields.contains(name) ? fields.at(name) : "";
    const bool minus = std::is_signed_v<Number> && text.starts_with('-');
    const bool prefix = base == 16 && (text.starts_with("0x") || text.starts_with("0X"));
    const auto digits = text.substr(minus ? 1 : prefix ? 2 : 0);
    errno = 0;
    const auto number = std::strtoull(digits.c_str(), nullptr, base);
    if (!digits.empty() && errno == 0 && number <= most + (minus ? 1 : 0) &&
        digits.find_first_not_of(&"fedcbaFEDCBA9876543210"[base == 16 ? 0 : 12]) ==
            std::string::npos) {
      return static_cast<Number>(minus ? -number : number);
    }
  }
  return other;
}

std::string modelLine(const Fields& fields, std::uint64_t stored) {
  const auto time = numberOf(fields, {"_SOURCE_REALTIME_TIMESTAMP"}, stored, kEndOfTime - 1);
  const auto seconds = static_cast<std::time_t>(time / 1'000'000) + kZone;
  std::array<char, 200> start{};
  const auto length =
      std::strftime(start.data(), start.size(), "%Y-%m-%d %H:%M:%S +0000", std::gmtime(&seconds));
  std::snprintf(start.data() + length, start.size() - length, " 0x%05lx 0x%lx %d ",
                numberOf(fields, {"TID", "_PID"}, 0UL, UINT64_MAX),
                numberOf(fields, {"VELL_ACTIVITY_ID"}, 0UL, UINT64_MAX, 16),
                numberOf(fields, {"_PID", "SYSLOG_PID"}, 0, INT32_MAX));
  return start.data() + textOf(fields, {"_EXE", "_COMM", "SYSLOG_IDENTIFIER"}) + "(" +
         textOf(fields, {"VELL_SENDER_IMAGE_PATH", "_EXE"}) +
         "):" + textOf(fields, {"VELL_SUBSYSTEM", "_SYSTEMD_UNIT"}) + " [" +
         textOf(fields, {"VELL_CATEGORY", "SYSLOG_IDENTIFIER"}) + "] " +
         textOf(fields, {"MESSAGE"}) + "\n";
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  setenv("TZ", "XXX-02:00", 1);
  static EntryDecoder decoder;
  const auto items = split({reinterpret_cast<const char*>(data), size}, "\x1e");
  const auto stored = std::strtoull(items[0].c_str(), nullptr, 10) % kEndOfTime;
  Fields fields;
  JournalValues values;
  for (const auto& item : items) {
    const auto name = item.substr(0, item.find('='));
    if (const auto field = findJournalField(name); field && name.size() < item.size()) {
      fields[name] = item.substr(name.size() + 1);
      values[indexOf(*field)] = fields[name];
    }
  }
  const auto entry = decoder.decode(values, stored);
  const auto line = formatOsLogLine(entry);
  std::size_t broken = 0;
  const auto text = wellFormed(line, broken);
  require(broken == 0, "not valid UTF-8");
  requireEqual(text, wellFormed(modelLine(fields, stored), broken));
  require(broken > 0 || line == modelLine(fields, stored), "well-formed text changed");
  require(entry.type == (fields.contains("MESSAGE") ? kLogEntryMessage : 0), "another type");
  return 0;
}
