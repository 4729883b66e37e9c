#include "framework/command_shell.h"
#include "platform/process_end.h"
#include "platform/program.h"
#include "platform/telephony.h"
#include "platform/threads.h"
#include "tool/config.h"
#include "tool/vell_shell.h"

#include <cstdlib>
#include <iostream>
#include <list>
#include <memory>
#include <new>
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

/// The shell thread: takes the signals that the process was started with, runs the shell on
/// `words` and ends the process.
void runShellThread(const std::list<std::string>& words, const sigset_t& blockedSignals) {
  pthread_sigmask(SIG_SETMASK, &blockedSignals, nullptr);
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
  std::set_new_handler([] { endProcess("out of memory"); });
  prepareStandardStreams();
  const auto words = CommandShell::convertCmdArgsToList(count, vector);
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
  // From here on, signals are the shell thread's: it reads from the terminal.
  const auto blockedBefore = blockSignals();
  startThread("velltool.shell", [words, blockedBefore] {
    runShellThread(words, blockedBefore);
  }).detach();
  runMainEventLoop();
  return EXIT_SUCCESS;
}
