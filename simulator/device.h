#pragma once

#include "simulator/profile.h"

#include <string>
#include <vector>

namespace simulator {

/// Makes the device that `profile` describes, starts its bus and its services as children of this
/// process, and waits until they can be reached. Runs `command` on it, starts services that ask for
/// it again meanwhile, and removes the device, with all that `command` has started. Returns the
/// exit status of `command`, 128 and the signal when one ended it; 1, after a complaint, when there
/// can be no device.
///
/// A signal to end that this process gets meanwhile goes to the command and all that descends from
/// it; a command that does not obey soon is killed. Uses waitpid(2) for any child, and the
/// environment: once in a process, with one thread.
int runOnDevice(const Profile& profile, const std::vector<std::string>& command);

}  // namespace simulator
