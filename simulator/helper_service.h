#pragma once

#include "simulator/service.h"

namespace simulator {

/// The manager's helper on the bus, `org.vell.Helper1`.
class HelperService {
 public:
  HelperService(Profile describedDevice, std::filesystem::path deviceRoot, const RequestLog& log);

  /// Connects and owns the name; see `Service::connect`.
  bool connect();

  /// Serves until the bus goes away. Returns the exit status of the process.
  int run() { return service.run(); }

 private:
  static int perform(sd_bus_message* call, void* userdata, sd_bus_error* error);

  const Profile profile;
  Service service;
};

}  // namespace simulator
