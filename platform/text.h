#pragma once

#include <string>

/// Whether `left` and `right` are equal when the case of ASCII letters is ignored. Other bytes are
/// compared as they are, in every locale.
bool equalNoCase(const std::string& left, const std::string& right);
