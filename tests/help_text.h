#pragma once

#include <string>

/// The help of the node `name`, with `entries` between its header and the built-in words.
inline std::string helpText(const std::string& name, const std::string& entries) {
  return "\nOptions for command '\x1b[32m" + name + "\x1b[39m':\n\n" + entries +
         "\t              cd  -  <sub-command>\n"
         "\t            help\n\t            back\n\t            quit\n\n";
}
