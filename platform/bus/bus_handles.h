#pragma once

#include "platform/portable/handle.h"

#include <systemd/sd-bus.h>

/// Owners of the handles of sd-bus(3). Each is used and released on the thread that owns the
/// connection.

/// Drops what is still queued: a connection is closed when nobody waits for it any more.
using BusPtr = HandlePtr<sd_bus, sd_bus_close_unref>;
using BusMessagePtr = HandlePtr<sd_bus_message, sd_bus_message_unref>;
using BusSlotPtr = HandlePtr<sd_bus_slot, sd_bus_slot_unref>;

/// An error of the bus library: a place for it to be written to, freed at the end of the scope.
class BusError {
 public:
  BusError() = default;
  BusError(const BusError&) = delete;
  BusError& operator=(const BusError&) = delete;
  ~BusError() { sd_bus_error_free(&error); }

  sd_bus_error* get() { return &error; }

 private:
  sd_bus_error error = {nullptr, nullptr, 0};
};
