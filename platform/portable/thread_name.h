#pragma once

#include <pthread.h>

#include <string>
#include <thread>

/// Names `thread`, which runs, after the first 15 bytes of `name`: no more go into
/// pthread_setname_np(3).
inline void nameThread(std::thread& thread, const std::string& name) {
  constexpr std::size_t kLongestName = 15;
  pthread_setname_np(thread.native_handle(), name.substr(0, kLongestName).c_str());
}
