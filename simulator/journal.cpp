#include "simulator/journal.h"

#include "platform/posix/whole_write.h"
#include "simulator/child_process.h"
#include "simulator/complaint.h"
#include "simulator/journal_entry.h"

#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <iterator>
#include <string>
#include <system_error>

namespace simulator {

namespace {

/// What a program of the device logs.
struct Line {
  const char* executable;
  int process;
  const char* unit;
  const char* message;
};

/// In the order of the journal, again and again. The kernel is the one without a process.
constexpr Line kLines[] = {
    {"/usr/libexec/Linkward", 411, "linkward.service", "cell 310-410 chosen"},
    {"/usr/libexec/LinkwardMobileHelper", 420, "linkward.service", "carrier settings 42 read"},
    {"/usr/libexec/LinkwardRootHelper", 421, "linkward.service", "interface pdp0 brought up"},
    {"/usr/libexec/vell-helper", 388, "vell-helper.service", "timestamp handed out"},
    {"/usr/libexec/Airgroved", 402, "airgroved.service", "beacon lost"},
    {"/usr/libexec/Linkward", 411, "linkward.service", "signal -97 dBm"},
    {"/usr/libexec/Tessfield", 433, "tessfield.service", "map tile 7/64/42 loaded"},
    {"/usr/libexec/voltkeeperd", 377, "voltkeeperd.service", "battery 81 %"},
    {"/usr/lib/HaldenBaseband.framework/haldend", 395, "haldend.service", "modem awake"},
    {"kernel", 0, "", "rpmsg: channel 7 opened"},
    {"/usr/libexec/Airgroved", 402, "airgroved.service", "beacon found again"},
    {"/usr/libexec/Linkward", 411, "linkward.service", "registered, roaming off"},
    {"/usr/libexec/voltkeeperd", 377, "voltkeeperd.service", "charging ended"},
    {"/usr/lib/HaldenBaseband.framework/haldend", 395, "haldend.service", "trace buffer at 12 %"},
    {"/usr/sbin/timed", 301, "timed.service", "clock 3 ms ahead"},
    {"/usr/sbin/sshd", 512, "ssh.service", "connection closed"},
};

JournalEntry makeEntry(JournalTime time, const Line& line, std::size_t round) {
  const std::string executable(line.executable);
  const auto name = executable.substr(executable.rfind('/') + 1);
  JournalEntry entry = {
      time, {{"MESSAGE", line.message}, {"PRIORITY", "6"}, {"SYSLOG_IDENTIFIER", name}}};
  if (line.process == 0) {
    entry.fields.emplace_back("_TRANSPORT", "kernel");
    return entry;
  }
  const auto thread = line.process + static_cast<int>(round % 3);
  entry.fields.insert(entry.fields.end(), {{"_PID", std::to_string(line.process)},
                                           {"TID", std::to_string(thread)},
                                           {"_COMM", name.substr(0, 15)},
                                           {"_EXE", executable},
                                           {"_SYSTEMD_UNIT", line.unit},
                                           {"_TRANSPORT", "journal"}});
  return entry;
}

/// What the device has logged in the hour up to `now`, in the export format.
std::string lastHour(JournalTime now) {
  constexpr std::size_t kEntries = 240;
  constexpr std::chrono::microseconds kHour = std::chrono::hours(1);
  std::string text;
  for (std::size_t at = 0; at < kEntries; ++at) {
    const auto time = now - kHour * (kEntries - at) / (kEntries + 1);
    const auto& line = kLines[at % std::size(kLines)];
    text += toExportFormat(makeEntry(time, line, at / std::size(kLines)));
  }
  return text;
}

/// Starts a process that stores, in `file`, what is written to its pipe in the export format.
Child startStoring(const std::filesystem::path& file) {
  return startChild({VELL_JOURNAL_REMOTE, "-o", file.string(), "-"}, {.piped = STDIN_FILENO});
}

/// Stores `text` and waits until it is there.
bool store(const std::filesystem::path& file, const std::string& text) {
  auto storing = startStoring(file);
  const bool written = storing.process > 0 && !writeWhole(storing.pipe.get(), text);
  storing.pipe = FileDescriptor();
  return storing.process > 0 && awaitChild(storing.process) == 0 && written;
}

}  // namespace

int serveJournal(const std::filesystem::path& root) {
  // A process that stores and dies is noticed when it is written to.
  std::signal(SIGPIPE, SIG_IGN);
  const auto file = root / kJournalFile;
  std::error_code error;
  std::filesystem::create_directories(file.parent_path(), error);
  if (!store(file, lastHour(presentTime()))) {
    complain("the device's journal could not be stored");
    return EXIT_FAILURE;
  }
  const auto socket = listenForEntries(root / "run/systemd/journal/socket");
  const auto storing = startStoring(file);
  if (!socket || storing.process < 0) {
    return EXIT_FAILURE;
  }
  std::cout << "ready" << std::endl;
  while (const auto entry = receiveEntry(socket.get(), 0)) {
    // One that is malformed has no fields.
    if (!entry->fields.empty() && writeWhole(storing.pipe.get(), toExportFormat(*entry))) {
      break;
    }
  }
  complain(std::string("the device's journal is lost: ") + std::strerror(errno));
  return EXIT_FAILURE;
}

}  // namespace simulator
