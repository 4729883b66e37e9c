#pragma once

#include "platform/portable/handle.h"

#include <systemd/sd-bus.h>

/// Owners of the handles of sd-bus(3). Each is used and released on the thread that owns the
/// connection.

/// Drops what is still queued: a connection is closed when nobody waits for it any more.
using BusPtr = HandlePtr<sd_bus, sd_bus_close_unref>;
using BusMessagePtr = HandlePtr<sd_bus_message, sd_bus_message_unref>;
using BusSlotPtr = HandlePtr<sd_bus_slot, sd_bus_slot_unref>;
