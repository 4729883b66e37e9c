#pragma once

#include <iostream>
#include <string>

namespace simulator {

/// Says on standard error, in one line that names the program, what is wrong. From any thread.
inline void complain(const std::string& what) {
  std::cerr << "vell-simulator: " + what + "\n" << std::flush;
}

}  // namespace simulator
