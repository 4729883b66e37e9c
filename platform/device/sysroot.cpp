#include "platform/device/sysroot.h"

#include <cstdlib>
#include <string>

namespace {

// Never destroyed: threads of the platform may still ask while the process exits.
const std::string& chosenRoot() {
  static const auto& chosen = *new std::string([] {
    const char* value = secure_getenv("VELL_SYSROOT");
    return value == nullptr ? "" : value;
  }());
  return chosen;
}

}  // namespace

const std::filesystem::path& sysroot() {
  static const auto& root = *new std::filesystem::path(isLocalMachine() ? "/" : chosenRoot());
  return root;
}

bool isLocalMachine() {
  return chosenRoot().empty();
}
