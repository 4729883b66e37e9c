#pragma once

#include "platform/clock.h"
#include "platform/time_zone.h"

#include <cstdint>
#include <optional>
#include <string_view>

/// The type of an entry that is a log message; entries of other types carry none.
inline constexpr std::uint32_t kLogEntryMessage = 1024;

/// One entry of the system log, as a reader hands it out. Texts are valid UTF-8 of any length and
/// may hold line breaks and NUL; an empty optional is a text that the entry lacks. Texts and time
/// zone belong to the reader and last until the handler that was given the entry returns.
struct LogEntry {
  std::uint32_t type = 0;
  LogTime time;                        ///< When it was logged.
  const TimeZone* timeZone = nullptr;  ///< In force where it was logged; never null.
  std::uint64_t threadIdentifier = 0;
  std::uint64_t activityIdentifier = 0;
  std::int32_t processIdentifier = 0;
  std::optional<std::string_view> process;          ///< Name of the process that logged.
  std::optional<std::string_view> sender;           ///< Name of the image that issued the entry.
  std::optional<std::string_view> senderImagePath;  ///< Full path of that image.
  std::optional<std::string_view> subsystem;
  std::optional<std::string_view> category;
  std::optional<std::string_view> composedMessage;
};
