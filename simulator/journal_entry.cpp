#include "simulator/journal_entry.h"

#include <endian.h>

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace simulator {

namespace {

/// Entries of one boot; the files of a journal tell boots apart.
constexpr const char* kBoot = "5b2e8c1d4f6a47909c3d1e0f2a4b6c8d";

void appendField(std::string& text, const std::string& name, const std::string& value) {
  const bool isPlain = std::all_of(value.begin(), value.end(), [](char character) {
    return static_cast<unsigned char>(character) >= ' ';
  });
  if (isPlain) {
    text.append(name).append("=").append(value).append("\n");
    return;
  }
  const std::uint64_t size = htole64(value.size());
  text.append(name).append("\n").append(reinterpret_cast<const char*>(&size), sizeof size);
  text.append(value).append("\n");
}

/// Takes a value with its length in front, and the line break behind it, off the start of `rest`.
std::optional<std::string_view> takeSizedValue(std::string_view& rest) {
  std::uint64_t size = 0;
  if (rest.size() <= sizeof size) {
    return std::nullopt;
  }
  std::memcpy(&size, rest.data(), sizeof size);
  size = le64toh(size);
  rest.remove_prefix(sizeof size);
  if (size >= rest.size() || rest[size] != '\n') {
    return std::nullopt;
  }
  const auto value = rest.substr(0, size);
  rest.remove_prefix(size + 1);
  return value;
}

bool isFieldName(std::string_view name) {
  return !name.empty() && std::all_of(name.begin(), name.end(), [](char character) {
    return (character >= 'A' && character <= 'Z') || (character >= '0' && character <= '9') ||
           character == '_';
  });
}

struct Program {
  std::string executable;
  int process;
  std::string unit;
  std::vector<std::string> messages;
};

const std::vector<Program>& programs() {
  static const auto& all = *new std::vector<Program>{
      {"/usr/libexec/Linkward",
       411,
       "linkward.service",
       {"cell 310-410 chosen", "signal -97 dBm", "registered, roaming off"}},
      {"/usr/libexec/LinkwardMobileHelper", 420, "linkward.service", {"carrier settings 42 read"}},
      {"/usr/libexec/LinkwardRootHelper", 421, "linkward.service", {"interface pdp0 brought up"}},
      {"/usr/libexec/vell-helper", 388, "vell-helper.service", {"timestamp handed out"}},
      {"/usr/libexec/Airgroved", 402, "airgroved.service", {"beacon lost", "beacon found again"}},
      {"/usr/libexec/Tessfield", 433, "tessfield.service", {"map tile 7/64/42 loaded"}},
      {"/usr/libexec/voltkeeperd", 377, "voltkeeperd.service", {"battery 81 %", "charging ended"}},
      {"/usr/lib/HaldenBaseband.framework/haldend",
       395,
       "haldend.service",
       {"modem awake", "trace buffer at 12 %"}},
      {"/usr/sbin/timed", 301, "timed.service", {"clock 3 ms ahead"}},
      {"/usr/sbin/sshd", 512, "ssh.service", {"connection closed"}},
  };
  return all;
}

JournalEntry makeEntry(std::chrono::sys_time<std::chrono::microseconds> time,
                       const Program& program, std::size_t round) {
  const auto name = program.executable.substr(program.executable.rfind('/') + 1);
  const auto process = std::to_string(program.process);
  return {time,
          {{"MESSAGE", program.messages[round % program.messages.size()]},
           {"PRIORITY", "6"},
           {"SYSLOG_IDENTIFIER", name},
           {"_PID", process},
           {"TID", std::to_string(program.process + static_cast<int>(round % 3))},
           {"_COMM", name.substr(0, 15)},
           {"_EXE", program.executable},
           {"_SYSTEMD_UNIT", program.unit},
           {"_TRANSPORT", "journal"}}};
}

}  // namespace

std::string toExportFormat(const JournalEntry& entry) {
  const auto time = std::to_string(entry.time.time_since_epoch().count());
  std::string text;
  appendField(text, "__REALTIME_TIMESTAMP", time);
  appendField(text, "__MONOTONIC_TIMESTAMP", time);
  appendField(text, "_BOOT_ID", kBoot);
  for (const auto& [name, value] : entry.fields) {
    appendField(text, name, value);
  }
  return text + "\n";
}

std::optional<JournalEntry> fromNativeProtocol(std::string_view datagram) {
  JournalEntry entry;
  while (!datagram.empty()) {
    const auto line = datagram.substr(0, datagram.find('\n'));
    if (line.size() == datagram.size()) {
      return std::nullopt;
    }
    datagram.remove_prefix(line.size() + 1);
    const auto name = line.substr(0, line.find('='));
    const auto value = name.size() < line.size() ? std::optional(line.substr(name.size() + 1))
                                                 : takeSizedValue(datagram);
    if (!value || !isFieldName(name)) {
      return std::nullopt;
    }
    if (name.front() != '_') {
      entry.fields.emplace_back(name, *value);
    }
  }
  return entry;
}

std::vector<JournalEntry> lastHourOfDevice(std::chrono::sys_time<std::chrono::microseconds> now) {
  constexpr std::size_t kEntries = 240;
  constexpr std::chrono::microseconds kHour = std::chrono::hours(1);
  std::vector<JournalEntry> entries;
  entries.reserve(kEntries);
  for (std::size_t at = 0; at < kEntries; ++at) {
    const auto age = kHour * (kEntries - at) / (kEntries + 1);
    const auto turn = at % (programs().size() + 1);
    const auto round = at / (programs().size() + 1);
    if (turn < programs().size()) {
      entries.push_back(makeEntry(now - age, programs()[turn], round));
    } else {
      entries.push_back({now - age,
                         {{"MESSAGE", "rpmsg: channel " + std::to_string(round) + " opened"},
                          {"PRIORITY", "6"},
                          {"SYSLOG_IDENTIFIER", "kernel"},
                          {"_TRANSPORT", "kernel"}}});
    }
  }
  return entries;
}

}  // namespace simulator
