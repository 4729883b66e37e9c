#include "framework/command_shell.h"
#include "platform/program.h"
#include "platform/telephony.h"
#include "tool/config.h"
#include "tool/vell_shell.h"

#include <pthread.h>

#include <cstdlib>
#include <cstring>
#include <iostream>
#include <list>
#include <memory>
#include <string>

namespace {

constexpr int kRefusedToStart = -1;
constexpr const char* kTelephonyDaemon = "Linkward";
constexpr const char* kBasebandHostDaemon = "modemhostd";

/// Whether a daemon that the tool can work with runs; a watch-class product needs none.
bool daemonsAreReady() {
  const bool telephonyRunning = processRunning(kTelephonyDaemon);
  return config::hw::watch() || telephonyRunning || processRunning(kBasebandHostDaemon);
}

/// The shell thread: runs the shell on the word list at `argument` and ends the process.
void* runShellThread(void* argument) {
  const auto words = *static_cast<const std::list<std::string>*>(argument);
  // Never destroyed: the process ends with the tree and the client alive.
  const std::shared_ptr<VellShell> shell(new VellShell);
  const bool result = shell->run(words);
  if (!std::cout) {
    std::cerr << "velltool: cannot write to standard output" << std::endl;
  }
  std::exit(result ? EXIT_SUCCESS : EXIT_FAILURE);
}

}  // namespace

int main(int count, char* vector[]) {
  prepareStandardStreams();
  auto words = CommandShell::convertCmdArgsToList(count, vector);
  if (radioType() == 0) {
    std::cout << "'velltool' is not supported on this product." << std::endl;
    return kRefusedToStart;
  }
  if (!daemonsAreReady()) {
    std::cout << "Linkward process is not running. Please run/load Linkward (or modemhostd) and "
                 "try again."
              << std::endl;
    return kRefusedToStart;
  }
  pthread_t shellThread = {};
  const int error = pthread_create(&shellThread, nullptr, runShellThread, &words);
  if (error != 0) {
    std::cerr << "velltool: cannot start the shell thread: " << std::strerror(error) << std::endl;
    return EXIT_FAILURE;
  }
  runMainEventLoop();
  return EXIT_SUCCESS;
}
