#pragma once

#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <vector>

/// One `KEY=value` line of a settings file.
struct Setting {
  std::string value;  ///< With quotes and escapes taken away.
  int line = 0;       ///< Where it stands, counted from 1.
};

/// A settings file, in the syntax of os-release(5): `KEY=value` lines, blank lines, lines that
/// start with `#`; a value may stand in single quotes, or in double quotes with backslash escapes.
/// Keys may hold points as well. The last line for a key counts, be it that it cannot be read.
struct SettingsFile {
  /// One thing that could not be read.
  struct Fault {
    int line = 0;  ///< 0 when it is the file as a whole.
    std::string what;
  };

  std::map<std::string, Setting> settings;
  std::vector<Fault> faults;  ///< The first twenty; if there are more, their number behind them.

  /// Notes a fault.
  void addFault(int line, std::string what);

  /// Reads the file at `path`. Empty when there is no such file; one that is there and cannot be
  /// read, or is larger than 1 MiB, gives a fault and no settings, a line that cannot be read gives
  /// a fault and is passed over.
  static std::optional<SettingsFile> read(const std::filesystem::path& path);

  /// As `read`, from a text.
  static SettingsFile parse(const std::string& text);

 private:
  std::size_t faultCount = 0;
};

/// Says each of `faults` in the system log, with file and line.
void reportFaults(const std::filesystem::path& path,
                  const std::vector<SettingsFile::Fault>& faults);
