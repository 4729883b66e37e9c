#pragma once

#include <string>

/// `text`, which is valid UTF-8, as it is compared when case and diacritics are ignored: full case
/// folding, no marks, and the same for composed and decomposed forms.
std::string foldedText(const std::string& text);
