// What the tool writes to the system log, below a sysroot and on the machine itself.

#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <gtest/gtest.h>

#include <chrono>
#include <fstream>

TEST(SystemLog, TakesLongMessagesWholeAndHoldsTheToolUpForASecondInAll) {
  const SimulatedDevice device("MANAGER=absent");
  const auto helpWith = [&](const std::string& line, const std::string& profile) {
    std::ofstream(device.root() / "etc/vell/device.conf") << profile;
    return device.runLine(line).status;
  };
  // In a mount namespace of its own, the machine is the device.
  const auto* onMachine = R"(exec unshare -rm sh -c 'cd "$VELL_SYSROOT" && mount --bind etc /etc &&
      mount --bind run /run && unset VELL_SYSROOT && exec "$0" help' "$0")";
  const std::string value(1'000'000, 'x');
  const std::string faults = "x\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\nx\n";
  const auto* fill = R"(cd "$VELL_SYSROOT"; python3 -c 'from socket import *
log = socket(AF_UNIX, SOCK_DGRAM)
log.connect("run/systemd/journal/socket")
while True: log.send(b"PRIORITY=3\nMESSAGE=full\n", MSG_DONTWAIT)')";
  SystemLogSocket log(device.root());
  for (const auto& [line, path] :
       {std::pair(R"(exec "$0" help)", (device.root() / "etc/vell/device.conf").string()),
        {onMachine, "/etc/vell/device.conf"}}) {
    SCOPED_TRACE(line);
    if (line == onMachine && device.runLine("unshare -rm true").status != 0) {
      GTEST_SKIP() << "There is no mount namespace to be had.";
    }
    EXPECT_EQ(helpWith(line, "RADIO_TYPE=" + value), 255);
    EXPECT_EQ(log.messages(),
              std::vector{path + ":1: RADIO_TYPE: '" + value + "' is not an integer"});

    // Nobody takes these away.
    EXPECT_EQ(device.runLine(fill).status, 1);
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(helpWith(line, "RADIO_TYPE=1\nPRODUCT_CODE=58\n" + faults), 0);
    const auto taken = std::chrono::steady_clock::now() - start;
    EXPECT_GE(taken, std::chrono::seconds(1));
    EXPECT_LT(taken, std::chrono::seconds(15));
    EXPECT_EQ(log.messages().at(0), "full");
  }
}

TEST(SystemLog, TakesTheFaultsOfSettingsOnce) {
  const SimulatedDevice device("MANAGER=absent");
  SystemLogSocket log(device.root());
  const auto profile = (device.root() / "etc/vell/device.conf").string();
  const auto traces = (device.root() / "var/lib/vell/traces.conf").string();
  const std::string failure = "Baseband log collection: Failed\n";
  // What the shell does to the settings, in turn; what the tool prints then, and logs.
  const std::tuple<std::string, std::string, std::vector<std::string>> cases[] = {
      {R"(rm "$1" && mkfifo "$1")",
       "'velltool' is not supported on this product.\n",
       {profile + ": not a file"}},
      {R"(rm "$1" && printf 'RADIO_TYPE=1\nPRODUCT_CODE="\\" \\$ \\` \\\\ \\x"\n\nnonsense\nCARRIER_BUILD="
             RADIO_VENDOR=99999999999\nRADIO_DIAG_QDSS=YES\nDEFAULT_COMPRESSION=zip \r\nA B=1\n=1\n \t# A\n' >"$1")",
       kPrompt + failure + kPrompt + failure + kPrompt,
       {profile + ":4: not a KEY=value line",
        profile + ":5: CARRIER_BUILD: value is not quoted as it must be",
        profile + ":9: not a KEY=value line", profile + ":10: not a KEY=value line",
        profile + R"(:2: PRODUCT_CODE: '" $ ` \ \x' is not an integer)",
        profile + ":6: RADIO_VENDOR: '99999999999' is not an integer",
        profile + ":7: RADIO_DIAG_QDSS: 'YES' is not yes or no",
        profile + ":8: DEFAULT_COMPRESSION: 'zip' is not nocompress, tar.gz, tar or an integer"}},
      {R"(echo RADIO_TYPE=1 >"$1" && printf "Baseband.TraceEnabled 'yes'\nnonsense" >"$2")",
       kPrompt + failure + kPrompt + failure + kPrompt,
       {traces + ":1: not a KEY=value line", traces + ":2: not a KEY=value line"}},
      {R"(truncate -s 1048577 "$2")",
       kPrompt + failure + kPrompt + failure + kPrompt,
       {traces + ": larger than 1 MiB"}},
      {R"(rm "$2" && mkdir "$2")",
       kPrompt + failure + kPrompt + failure + kPrompt,
       {traces + ": not a file"}}};
  for (const auto& [change, output, messages] : cases) {
    SCOPED_TRACE(change);
    const auto line = change + R"( && printf 'logdump bb\nlogdump bb\n' | "$0")";
    EXPECT_EQ(device.runLine(line, {profile, traces}).output, output);
    EXPECT_EQ(log.messages(), messages);
  }
}
