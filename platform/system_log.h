#pragma once

#include <string>

/// Where messages of one part of the system are filed in the system log.
struct LogContext {
  std::string subsystem;  ///< Reverse-DNS name of the product.
  std::string category;   ///< The part of the product.
};

/// Writes one message to the system log, at the level of errors. A message that cannot be written
/// is dropped, because there is nowhere else to say so. Ends the process when no file descriptor is
/// left to write it.
void logSystemError(const std::string& message);
