#pragma once

#include "simulator/service.h"

#include <sys/types.h>

#include <string>

namespace simulator {

/// The device's manager on the bus, `org.vell.Manager1`.
///
/// When its standard input is a pipe it obeys the lines that come in:
///   state STATE        the server state is STATE from now on, and an event says so
///   event NAME STATE   sends an event NAME that speaks of STATE; the state stays
/// Each is noted in the request log once the event is out.
class ManagerService {
 public:
  ManagerService(Profile describedDevice, std::filesystem::path deviceRoot, const RequestLog& log);

  /// Connects and owns the name; see `Service::connect`.
  bool connect();

  /// Serves until the bus goes away. Returns the exit status of the process.
  int run() { return service.run(); }

 private:
  static int openClient(sd_bus_message* call, void* userdata, sd_bus_error* error);
  static int performCommand(sd_bus_message* call, void* userdata, sd_bus_error* error);
  static int getServerState(sd_bus* bus, const char* path, const char* interface,
                            const char* property, sd_bus_message* reply, void* userdata,
                            sd_bus_error* error);
  static int controlReadable(sd_event_source* source, int file, std::uint32_t events,
                             void* userdata);
  bool takeControl();
  void obey(const std::string& line);
  void sendEvent(const std::string& name, const MessageDict& payload);

  Profile profile;
  Service service;
  EventSourcePtr control;
  std::string unfinishedLine;
};

}  // namespace simulator
