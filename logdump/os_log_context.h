#pragma once

#include "platform/system_log.h"

/// The tool's log context: made on the first call, exactly once, and the same on every call until
/// the process exits. From any thread.
const LogContext& GetOsLogContext();
