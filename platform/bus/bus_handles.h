#pragma once

#include <systemd/sd-bus.h>

#include <memory>

/// Owners for the handles of sd-bus(3): each frees what it holds, on the thread that owns the
/// connection.

struct BusCloser {
  /// Drops what is still queued: a connection is closed when nobody waits for it any more.
  void operator()(sd_bus* bus) const { sd_bus_close_unref(bus); }
};
using BusPtr = std::unique_ptr<sd_bus, BusCloser>;

struct BusMessageReleaser {
  void operator()(sd_bus_message* message) const { sd_bus_message_unref(message); }
};
using BusMessagePtr = std::unique_ptr<sd_bus_message, BusMessageReleaser>;

struct BusSlotReleaser {
  void operator()(sd_bus_slot* slot) const { sd_bus_slot_unref(slot); }
};
using BusSlotPtr = std::unique_ptr<sd_bus_slot, BusSlotReleaser>;

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
