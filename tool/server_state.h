#pragma once

#include "platform/message_dict.h"

/// Whether the manager's last server-state event said that it is up; false before the first one.
bool IsServerRunning();

/// Takes the state out of a server-state event. Anything but the started state, spelt exactly,
/// means that the manager is not up. Called where the manager client delivers events.
void followServerState(const MessageDict& payload);
