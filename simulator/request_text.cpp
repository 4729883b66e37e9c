#include "simulator/request_text.h"

#include <cstdint>
#include <iomanip>
#include <sstream>
#include <variant>

namespace simulator {

namespace {

/// Control characters, quotes and backslashes as C escapes.
std::string escaped(const std::string& text) {
  std::ostringstream result;
  result << std::hex << std::setfill('0');
  for (const char character : text) {
    const auto byte = static_cast<unsigned char>(character);
    if (byte < ' ' || byte == 0x7f) {
      result << "\\x" << std::setw(2) << unsigned{byte};
    } else {
      result << (byte == '"' || byte == '\\' ? "\\" : "") << byte;
    }
  }
  return result.str();
}

struct ValueDescriber {
  std::string operator()(const std::string& text) const { return "s " + quoted(text); }
  std::string operator()(std::int64_t number) const { return "x " + std::to_string(number); }
  std::string operator()(bool flag) const { return flag ? "b true" : "b false"; }
  std::string operator()(MessageDict::OtherType /*other*/) const { return "?"; }
};

}  // namespace

std::string quoted(const std::string& text) {
  return "\"" + escaped(text) + "\"";
}

std::string describe(const MessageDict& dict) {
  std::string text;
  for (const auto& [key, value] : dict.entries()) {
    text += (text.empty() ? "" : ", ") + escaped(key) + ": " + std::visit(ValueDescriber{}, value);
  }
  return "{" + text + "}";
}

}  // namespace simulator
