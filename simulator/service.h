#pragma once

#include "platform/bus/bus_handles.h"
#include "platform/portable/handle.h"
#include "simulator/answer.h"
#include "simulator/request_log.h"

#include <systemd/sd-bus.h>
#include <systemd/sd-event.h>

#include <filesystem>
#include <list>
#include <string>

namespace simulator {

/// How the process of a service ends when a fault ends it; `kStatusRestart` asks for a new one.
inline constexpr int kStatusDied = 70;
inline constexpr int kStatusRestart = 75;

using EventLoopPtr = HandlePtr<sd_event, sd_event_unref>;
using EventSourcePtr = HandlePtr<sd_event_source, sd_event_source_unref>;

/// What the services of the device share: a connection to its bus, a loop that serves it, a log of
/// the requests, and the giving of answers. A process has one, on its one thread.
class Service {
 public:
  /// Where a service is found on the bus, and what its replies look like.
  struct Identity {
    const char* name;
    const char* path;
    const char* interface;
    const char* method;       ///< The one that carries a request.
    bool repliesWithMessage;  ///< Whether a message comes between the status and the reply.
  };

  /// Serves the device at `deviceRoot`; `log` must outlive the service.
  Service(const Identity& ownIdentity, std::filesystem::path deviceRoot, const RequestLog& log);

  /// Connects to the system bus, serves `vtable`, in which `handler` stands for the request method,
  /// with `userdata`, and owns the name. Complains and returns false when one of these is not
  /// possible.
  bool connect(const sd_bus_vtable* vtable, sd_bus_message_handler_t handler, void* userdata);

  [[nodiscard]] sd_bus* connection() const { return bus.get(); }
  [[nodiscard]] sd_event* eventLoop() const { return loop.get(); }
  [[nodiscard]] const RequestLog& requestLog() const { return requests; }

  /// Does with the method call `call` what `answer` says; `about` describes the request. Fit to be
  /// what a method handler returns.
  int give(sd_bus_message* call, Answer answer, const std::string& about);

  /// Serves until the bus goes away. Returns the exit status of the process.
  int run();

 private:
  struct Pending {
    Service* service;
    BusMessagePtr call;
    Answer answer;
    std::string about;
    EventSourcePtr timer;
  };

  static int requestArrived(sd_bus_message* call, void* userdata, sd_bus_error* error);
  static int timerFired(sd_event_source* source, std::uint64_t time, void* userdata);
  int carryOut(sd_bus_message* call, Answer answer, const std::string& about);
  int reply(sd_bus_message* call, const Answer& answer) const;

  const Identity identity;
  const std::filesystem::path root;
  const RequestLog& requests;
  EventLoopPtr loop;
  BusPtr bus;
  BusSlotPtr table;
  BusSlotPtr ahead;
  sd_bus_message_handler_t requestHandler = nullptr;
  void* handlersData = nullptr;
  std::list<Pending> held;  ///< Requests that wait for their delay to pass.
};

}  // namespace simulator
