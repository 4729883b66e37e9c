#pragma once

#include <csignal>
#include <functional>
#include <string>
#include <thread>

/// Blocks all signals but those of faults on this thread, and so on the threads that it starts: a
/// signal to the process goes to the threads that expect it, and a pipe that breaks under a write
/// shows as an error. Returns what was blocked before, for pthread_sigmask(3).
sigset_t blockSignals();

/// Starts a thread that runs `work` with signals blocked as `blockSignals` does. `name` is for
/// people; its first 15 bytes are shown, see pthread_setname_np(3). Ends the process when the
/// system has no thread to give.
std::thread startThread(const std::string& name, std::function<void()> work);
