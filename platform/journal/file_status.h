#pragma once

#include <compare>
#include <string>

/// Whether a journal file, or a folder of them, is read whole; carries the first cause that says
/// otherwise from where it is noticed to where it is told.
struct FileStatus {
  std::string path;
  std::string cause = {};  ///< Why entries are or may be missing. Empty: none are.

  [[nodiscard]] bool isWhole() const { return cause.empty(); }

  /// Notes a cause. The first one counts.
  void note(const std::string& found) { cause = isWhole() ? found : cause; }

  /// For people.
  [[nodiscard]] std::string text() const { return path + ": " + cause; }

  // NOLINTNEXTLINE(modernize-use-nullptr): taken for one in what the compiler makes of this.
  auto operator<=>(const FileStatus&) const = default;
};
