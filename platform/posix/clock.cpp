#include "platform/clock.h"

LogTime currentTime() {
  return std::chrono::floor<std::chrono::microseconds>(std::chrono::system_clock::now());
}
