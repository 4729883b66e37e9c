#include "platform/unicode/folded_text.h"

#include "platform/portable/handle.h"

#include <utf8proc.h>

#include <cstdlib>

namespace {

std::string mapped(const std::string& text, int options) {
  utf8proc_uint8_t* result = nullptr;
  const auto length = utf8proc_map(reinterpret_cast<const utf8proc_uint8_t*>(text.data()),
                                   static_cast<utf8proc_ssize_t>(text.size()), &result,
                                   static_cast<utf8proc_option_t>(options));
  const HandlePtr<utf8proc_uint8_t, std::free> owner(result);
  if (length < 0) {
    return text;
  }
  return {reinterpret_cast<const char*>(result), static_cast<std::size_t>(length)};
}

}  // namespace

std::string foldedText(const std::string& text) {
  // Marks go first: folding turns a letter composed with some marks (the Greek iota subscript) into
  // two letters, which it does not do once they are apart. Composing at the end keeps a syllable of
  // Hangul one letter.
  const auto unmarked = mapped(text, UTF8PROC_DECOMPOSE | UTF8PROC_STRIPMARK);
  return mapped(unmarked, UTF8PROC_COMPOSE | UTF8PROC_CASEFOLD | UTF8PROC_STRIPMARK);
}
