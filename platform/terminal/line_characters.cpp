#include "platform/terminal/line_characters.h"

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <cwchar>
#include <cwctype>
#include <vector>

namespace {

// The stand-ins of either width, by their order in `standInTexts`.
constexpr wchar_t kFirstNarrow = 0x100000;  // For private use.
constexpr wchar_t kFirstWide = 0x17000;     // Tangut.
constexpr std::size_t kStandIns = 6000;

std::vector<std::wstring> standInTexts;

/// The place of a stand-in, also of one that stands for nothing; `kStandIns` for other characters.
std::size_t standInIndex(wchar_t character) {
  const auto first = character < kFirstNarrow ? kFirstWide : kFirstNarrow;
  return std::min(static_cast<std::size_t>(character) - static_cast<std::size_t>(first), kStandIns);
}

std::wstring textOf(wchar_t character) {
  const auto index = standInIndex(character);
  return index < standInTexts.size() ? standInTexts[index] : std::wstring(1, character);
}

}  // namespace

wchar_t joinMark(wchar_t before, wchar_t character) {
  if (character == 0 || wcwidth(character) != 0) {
    return standInIndex(character) == kStandIns ? character : 0;
  }
  const auto text = textOf(before) + character;
  const auto known = std::find(standInTexts.begin(), standInTexts.end(), text);
  const auto index = known - standInTexts.begin();
  if (wcwidth(before) < 1 || static_cast<std::size_t>(index) == kStandIns) {
    return 0;
  }
  if (known == standInTexts.end()) {
    standInTexts.push_back(text);
  }
  return (wcwidth(before) == 1 ? kFirstNarrow : kFirstWide) + static_cast<wchar_t>(index);
}

std::optional<std::wstring> toCharacters(const std::string& text) {
  std::wstring decoded(text.size(), L'\0');
  // Where it fails, a null is left, which cannot be edited.
  const auto length = std::mbstowcs(decoded.data(), text.c_str(), text.size());
  std::wstring characters;
  for (const auto character : decoded.substr(0, length)) {
    const auto joined = joinMark(characters.empty() ? L'\0' : characters.back(), character);
    if (joined == 0 || std::iswprint(static_cast<std::wint_t>(character)) == 0) {
      return std::nullopt;
    }
    if (joined != character) {
      characters.pop_back();
    }
    characters += joined;
  }
  return characters;
}

std::string toText(std::wstring_view characters) {
  std::wstring decoded;
  for (const auto character : characters) {
    decoded += textOf(character);
  }
  std::string text(decoded.size() * MB_LEN_MAX, '\0');
  text.resize(std::wcstombs(text.data(), decoded.c_str(), text.size()));
  return text;
}
