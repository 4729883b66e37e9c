#pragma once

#include <optional>
#include <string>
#include <string_view>

// A line as libedit edits it. libedit takes each character for one cell of the screen or two, and
// loses those that have no width. So a letter and the marks on it are one character here: a
// stand-in of the letter's width. All calls are from the thread that edits, whose locale is UTF-8.

/// `character` itself, or when it is a mark what stands for `before`, which is the character before
/// it, and the mark; 0 when it cannot be edited.
wchar_t joinMark(wchar_t before, wchar_t character);

/// `text` as the editor holds it; nullopt when it is no UTF-8 or not all of it can be seen.
std::optional<std::wstring> toCharacters(const std::string& text);

/// The text that `characters` stand for.
std::string toText(std::wstring_view characters);
