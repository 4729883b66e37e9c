#pragma once

#include "platform/linux/device_profile.h"
#include "platform/message_dict.h"
#include "simulator/device_model.h"

#include <string>
#include <vector>

/// The device behind the in-process platform: the tests' own side of every service.
namespace in_process {

/// What a test sets before it acts, and reads after it has acted.
struct Device {
  simulator::DeviceModel model;
  DeviceProfile profile;
  bool managerRuns = true;
  std::string programName = "velltool";
  std::vector<std::string> clientCalls;  ///< What was done to the client of the manager.
};

/// The device there is.
Device& device();

/// Puts a new device, of a profile in the simulator's format, in place of the one there is. A
/// profile that cannot be read ends the test program.
Device& startDevice(const std::string& profileText);

/// Lets go of the clients of the device there is.
void closeClients();

/// Has the manager send an event to every client, and returns when it has been handled.
void sendEvent(const std::string& name, const MessageDict& payload);

}  // namespace in_process
