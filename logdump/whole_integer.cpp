#include "logdump/whole_integer.h"

#include <stdexcept>

std::optional<int> parseWholeInteger(const std::string& text) {
  try {
    std::size_t consumed = 0;
    const int number = std::stoi(text, &consumed, 0);
    return consumed == text.size() ? std::optional(number) : std::nullopt;
  } catch (const std::invalid_argument&) {
    return std::nullopt;
  } catch (const std::out_of_range&) {
    return std::nullopt;
  }
}
