#pragma once

#include <cstdint>

/// The names and fixed values of the manager's interface, `org.vell.Manager1`: commands, events,
/// dictionary keys, and the values that go under them.
namespace vell {

inline constexpr const char* kEventServerStateChange = "ServerStateChange";
inline constexpr const char* kKeyServerState = "ServerState";
inline constexpr const char* kServerStateStarted = "Started";

inline constexpr const char* kCommandGetTraceProperty = "GetTraceProperty";
inline constexpr const char* kCommandTraceDumpState = "TraceDumpState";

inline constexpr const char* kKeyTraceName = "TraceName";
inline constexpr const char* kTraceSystemLogs = "SystemLogs";
inline constexpr const char* kTraceBaseband = "Baseband";
inline constexpr const char* kKeyTracePropertyName = "TracePropertyName";
inline constexpr const char* kKeyTracePropertyValue = "TracePropertyValue";
inline constexpr const char* kKeyTraceMode = "TraceMode";
inline constexpr const char* kKeyTraceEnabled = "TraceEnabled";
inline constexpr const char* kKeyTraceHighTput = "TraceHighThroughput";
inline constexpr const char* kUnknown = "Unknown";

inline constexpr const char* kKeyTraceAction = "TraceAction";
inline constexpr const char* kCollectTelephonyLogs = "CollectTelephonyLogs";
inline constexpr const char* kCollectTelephonyLogsWithCoredump = "CollectTelephonyLogsWithCoredump";
inline constexpr const char* kCollectBasebandLogs = "CollectBasebandLogs";
inline constexpr const char* kKeyTraceDumpStateReason = "TraceDumpStateReason";
inline constexpr const char* kKeyTraceDumpStatePerformCompression =
    "TraceDumpStatePerformCompression";
inline constexpr const char* kKeyTraceUserConfirmation = "TraceUserConfirmation";
inline constexpr const char* kKeyBasebandResetReason = "BasebandResetReason";
inline constexpr const char* kKeyBasebandResetType = "BasebandResetType";
inline constexpr const char* kBasebandResetTypeHard = "Hard";
inline constexpr const char* kKeyBasebandResetSubType = "BasebandResetSubType";
inline constexpr const char* kBasebandResetSubTypeOtherErrors = "OtherErrors";
inline constexpr const char* kKeyTimestampString = "TimestampString";

/// The status of a command that found no manager (0xE020E001 as a signed number).
inline constexpr std::int32_t kStatusManagerNotRunning = static_cast<std::int32_t>(0xE020E001U);

}  // namespace vell
