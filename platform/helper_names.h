#pragma once

/// The names and fixed values of the helper's interface, `org.vell.Helper1`.
namespace vell::helper {

inline constexpr const char* kCommandTidewellStatus = "TidewellStatus";
inline constexpr const char* kKeyTimeout = "Timeout";
inline constexpr const char* kKeyTimestampString = "TimestampString";

}  // namespace vell::helper
