#include "platform/unicode/utf8.h"

#include <utf8proc.h>

#include <cstdint>
#include <cstring>

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";

/// How many bytes of the ill-formed sequence that starts `bytes` make one replacement: as many as
/// could have begun a well-formed one (the maximal subpart of the Unicode Standard, chapter 3.9).
std::size_t brokenLength(std::string_view bytes) {
  const auto at = [&](std::size_t index) { return static_cast<unsigned char>(bytes[index]); };
  const unsigned lead = at(0);
  if (lead < 0xC2 || lead > 0xF4) {
    return 1;
  }
  const std::size_t whole = lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
  unsigned lowest = lead == 0xE0 ? 0xA0 : lead == 0xF0 ? 0x90 : 0x80;
  unsigned highest = lead == 0xED ? 0x9F : lead == 0xF4 ? 0x8F : 0xBF;
  std::size_t length = 1;
  while (length < whole && length < bytes.size() && at(length) >= lowest && at(length) <= highest) {
    ++length;
    lowest = 0x80;
    highest = 0xBF;
  }
  return length;
}

/// How many bytes at the start of `bytes` are ASCII, found a machine word at a time.
std::size_t asciiLength(std::string_view bytes) {
  constexpr std::uint64_t kHighBits = 0x8080808080808080;
  std::size_t length = 0;
  for (std::uint64_t word = 0; length + sizeof word <= bytes.size(); length += sizeof word) {
    std::memcpy(&word, bytes.data() + length, sizeof word);
    if ((word & kHighBits) != 0) {
      break;
    }
  }
  while (length < bytes.size() && static_cast<unsigned char>(bytes[length]) < 0x80) {
    ++length;
  }
  return length;
}

struct CodePoint {
  std::size_t length = 0;  ///< In bytes; 0 when it is ill-formed.
  utf8proc_int32_t value = 0;
};

CodePoint firstCodePoint(std::string_view bytes) {
  utf8proc_int32_t value = 0;
  const auto length = utf8proc_iterate(reinterpret_cast<const utf8proc_uint8_t*>(bytes.data()),
                                       static_cast<utf8proc_ssize_t>(bytes.size()), &value);
  return {length > 0 ? static_cast<std::size_t>(length) : 0, value};
}

bool isNoncharacter(utf8proc_int32_t value) {
  return (value >= 0xFDD0 && value <= 0xFDEF) || (value & 0xFFFE) == 0xFFFE;
}

/// How many bytes at the start of `bytes` are well-formed.
std::size_t validLength(std::string_view bytes) {
  std::size_t length = asciiLength(bytes);
  while (length < bytes.size()) {
    const auto taken = firstCodePoint(bytes.substr(length)).length;
    if (taken == 0) {
      break;
    }
    length += taken;
    length += asciiLength(bytes.substr(length));
  }
  return length;
}

}  // namespace

bool isValidUtf8(std::string_view bytes) {
  return validLength(bytes) == bytes.size();
}

std::string validUtf8(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size());
  while (!bytes.empty()) {
    const auto valid = validLength(bytes);
    text.append(bytes.substr(0, valid));
    bytes.remove_prefix(valid);
    if (!bytes.empty()) {
      text.append(kReplacement);
      bytes.remove_prefix(brokenLength(bytes));
    }
  }
  return text;
}

std::string takeUtf8(std::string& bytes) {
  std::string_view rest = bytes;
  const auto isBegun = [&] {
    const auto lead = static_cast<unsigned char>(rest.front());
    return lead >= 0xC2 && lead <= 0xF4 && brokenLength(rest) == rest.size();
  };
  for (rest.remove_prefix(validLength(rest)); !rest.empty() && !isBegun();
       rest.remove_prefix(validLength(rest))) {
    rest.remove_prefix(brokenLength(rest));
  }
  auto text = validUtf8(bytes.substr(0, bytes.size() - rest.size()));
  bytes = rest;
  return text;
}

std::string interchangeText(std::string_view bytes) {
  const auto valid = validUtf8(bytes);
  std::string text;
  text.reserve(valid.size());
  for (std::string_view rest = valid; !rest.empty();) {
    const auto [length, value] = firstCodePoint(rest);
    text.append(value == 0 || isNoncharacter(value) ? kReplacement : rest.substr(0, length));
    rest.remove_prefix(length);
  }
  return text;
}
