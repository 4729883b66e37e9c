#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <iostream>
#include <string>
#include <string_view>
#include <vector>

/// One run of a target on one input; see https://llvm.org/docs/LibFuzzer.html. A target is linked
/// with libFuzzer, or with a main that feeds it the files of its corpus. It aborts on a fault.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

/// Aborts, and shows both, when `actual` is not `expected`.
inline void requireEqual(const std::string& actual, const std::string& expected) {
  if (actual != expected) {
    std::cerr << "=== actual:\n" << actual << "\n=== expected:\n" << expected << "\n";
    std::abort();
  }
}

/// Aborts, and says `what`, when `condition` does not hold.
inline void require(bool condition, const char* what) {
  requireEqual(condition ? "" : what, "");
}

/// The pieces of `text` between the characters of `separators`, empty ones included.
inline std::vector<std::string> split(std::string_view text, const char* separators) {
  std::vector<std::string> pieces;
  for (auto at = text.find_first_of(separators); at != std::string_view::npos;
       at = text.find_first_of(separators)) {
    pieces.emplace_back(text.substr(0, at));
    text.remove_prefix(at + 1);
  }
  pieces.emplace_back(text);
  return pieces;
}
