#include "platform/terminal/plain_line.h"

#include <iostream>

std::optional<std::string> readPlainLine(const std::string& prompt) {
  std::cout << prompt << std::flush;
  std::string line;
  return std::cout && std::getline(std::cin, line) ? std::optional(line) : std::nullopt;
}
