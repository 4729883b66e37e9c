#include "platform/linux/utf8.h"

#include <utf8proc.h>

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

}  // namespace

std::string validUtf8(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size());
  while (!bytes.empty()) {
    utf8proc_int32_t codePoint = 0;
    const auto length = utf8proc_iterate(reinterpret_cast<const utf8proc_uint8_t*>(bytes.data()),
                                         static_cast<utf8proc_ssize_t>(bytes.size()), &codePoint);
    const auto taken = length > 0 ? static_cast<std::size_t>(length) : brokenLength(bytes);
    text.append(length > 0 ? bytes.substr(0, taken) : kReplacement);
    bytes.remove_prefix(taken);
  }
  return text;
}
