#pragma once

#include "platform/manager_client.h"

#include <set>
#include <string>
#include <vector>

/// The device behind the in-process platform: the tests' own side of every service.
namespace in_process {

/// What a test sets before it acts, and reads after it has acted.
struct Device {
  int productCode = 0;
  int radioVendor = 0;
  std::string programName = "velltool";
  std::set<std::string> processNames;
  std::vector<std::string> clientCalls;     ///< What was done to the client of the manager.
  vell::client::EventHandler eventHandler;  ///< As the client was given it, for events of a test.
};

/// The device there is.
inline Device device;

}  // namespace in_process
