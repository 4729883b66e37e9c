// Each way in which a collection can end: what is asked of the manager and of its helper, what is
// printed, and what lies on disk.

#include "simulator/request_text.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

namespace {

using Lines = std::vector<std::string>;

const std::string kFolder = "Path = /private/var/wireless/Library/Logs/Faultkeeper/Baseband/";
const std::string kScratch = "Path = /private/var/wireless/Library/Logs/VellManager/";

struct Case {
  std::string profile;
  Lines words;
  Lines requests;  ///< To the manager, then to the helper.
  std::string output;
  int status;
  Lines collections;
};

std::string query(const std::string& trace, const std::string& property) {
  return "PerformCommand GetTraceProperty {TraceName: s \"" + trace +
         "\", TracePropertyName: s \"" + property + "\"}";
}

const std::string kMode = query("SystemLogs", "TraceMode");
const std::string kEnabled = query("Baseband", "TraceEnabled");
const std::string kHighThroughput = query("Baseband", "TraceHighThroughput");
const std::string kHelper = "Perform 4 TidewellStatus {Timeout: x 1500}";
const std::string kByUser = "[velltool] User triggered";

std::string telephony(const std::string& reason, const std::string& rest) {
  return "PerformCommand TraceDumpState {TraceAction: s \"CollectTelephonyLogs\", "
         "TraceDumpStateReason: s " +
         simulator::quoted(reason) + ", TraceDumpStatePerformCompression: x " + rest + "}";
}

std::string core(const std::string& reason, const std::string& rest) {
  return "PerformCommand TraceDumpState {BasebandResetType: s \"Hard\", "
         "BasebandResetSubType: s \"OtherErrors\", "
         "TraceAction: s \"CollectTelephonyLogsWithCoredump\", BasebandResetReason: s " +
         simulator::quoted(reason) + ", TraceDumpStatePerformCompression: x " + rest + "}";
}

std::string baseband(const std::string& reason, int mode) {
  return "PerformCommand TraceDumpState {TraceDumpStateReason: s " + simulator::quoted(reason) +
         ", TraceAction: s \"CollectBasebandLogs\", TraceDumpStatePerformCompression: x " +
         std::to_string(mode) + "}";
}

void expectRuns(const std::string& command, const std::string& profile,
                const std::vector<Case>& cases) {
  for (const auto& testCase : cases) {
    SCOPED_TRACE(testCase.profile + "\n" + testing::PrintToString(testCase.words));
    // The keys of the case come last, and a later line counts before an earlier one.
    const SimulatedDevice device("RADIO_TYPE=1\nTIMESTAMP=T\n" + profile + testCase.profile);
    Lines words = {"logdump", command};
    words.insert(words.end(), testCase.words.begin(), testCase.words.end());
    const auto result = device.runTool(words);
    EXPECT_EQ(result.output, testCase.output);
    EXPECT_EQ(result.errors, "");
    EXPECT_EQ(result.status, testCase.status);
    Lines requests;
    for (const auto* service : {"manager", "helper"}) {
      for (const auto& line : device.requests(service)) {
        if (line.starts_with("Perform")) {
          requests.push_back(line);
        }
      }
    }
    EXPECT_EQ(requests, testCase.requests);
    EXPECT_EQ(device.collections(), testCase.collections);
  }
}

}  // namespace

// clang-format off

TEST(Collection, OfTelephonyLogs) {
  const std::string success = "Telephony log collection: Success\n";
  const std::string failure = "Telephony log collection: Failed\n";
  const std::string open = success + kFolder + "log-bb-T-*\n";
  const std::string confirmation = ", TraceUserConfirmation: b false";
  const Lines parts = {"log-bb-T-state", "log-bb-T-telephony"};
  const Lines plain = {kMode, telephony(kByUser, "0")};
  const Lines packed = {kMode, telephony(kByUser, "2")};
  expectRuns("tel", "", {
      {"", {}, plain, open, 0, parts},
      {"", {"Tar.Gz", "nonui", "my", "tar"}, {kMode, telephony("[velltool] my", "1" + confirmation)},
       success + kFolder + "log-bb-T.tar.gz\n", 0, {"log-bb-T.tar.gz"}},
      {"SystemLogs.TraceMode=3", {"tar"}, plain, open, 0, parts},
      {"SystemLogs.TraceMode=3\nSystemLogs.TraceMode_TYPE=integer", {"tar"}, packed,
       success + kFolder + "log-bb-T.tar\n", 0, {"log-bb-T.tar"}},
      {"SystemLogs.TraceMode_TYPE=other\nTIMESTAMP_TYPE=other", {"tar"}, packed,
       success + kFolder + "log-bb-.tar\n", 0, {"log-bb-.tar"}},
      {"DEFAULT_COMPRESSION=7\nCOMPRESSION_SUPPORTED=no", {}, {kMode, telephony(kByUser, "7")},
       open, 0, parts},
      {"GET_TRACE_PROPERTY=wrong-signature", {}, plain, open, 0, parts},
      {"TRACE_DUMP_STATE=no-dictionary", {}, plain, success, 0, parts},
      {"TRACE_DUMP_STATE=status:0xE020E001", {}, plain, failure, 0, {}},
      {"TRACE_DUMP_STATE=wrong-signature", {}, plain, failure, 0, {}},
      {"TRACE_DUMP_STATE=die", {}, plain, failure, 0, {}},
      {"GET_TRACE_PROPERTY=die", {}, {kMode}, failure, 0, {}},
      // Bytes that the bus does not carry, words of many kilobytes, line breaks.
      {"", {"a\xFF\xC3z\n"}, {kMode, telephony("[velltool] a\xEF\xBF\xBD\xEF\xBF\xBDz\n", "0")},
       open, 0, parts},
      {"", {std::string(100000, 'x'), ""},
       {kMode, telephony("[velltool] " + std::string(100000, 'x'), "0")}, open, 0, parts},
  });
}

TEST(Collection, OfTelephonyLogsWithACoreDump) {
  const std::string success = "Telephony log collection with Coredump: Success\n" + kFolder;
  expectRuns("core", "DEFAULT_COMPRESSION=tar.gz\nSystemLogs.TraceMode=3\n", {
      {"", {"", "tar"}, {core("[velltool] ", "1")}, success + "log-bb-T.tar.gz\n", 0,
       {"log-bb-T.tar.gz"}},
      {"", {"nocompress"}, {core(kByUser, "0")}, success + "log-bb-T-cd\n", 0,
       {"log-bb-T-cd", "log-bb-T-telephony"}},
      {"RADIO_VENDOR=2\nDEFAULT_COMPRESSION=nocompress", {"NONUI"},
       {core(kByUser, "0, TraceUserConfirmation: b false")}, success + "log-bb-T-coredump\n", 0,
       {"log-bb-T-coredump", "log-bb-T-telephony"}},
      {"TRACE_DUMP_STATE=status:-2147483648", {}, {core(kByUser, "1")},
       "Telephony log collection with Coredump: Failed\n", 0, {}},
  });
}

TEST(Collection, OfBasebandLogsFromARunningManager) {
  const std::string success = "Baseband log collection: Success (Vell running)\n" + kFolder;
  const std::string failure = "Baseband log collection: Failed\n";
  const std::string off = "Baseband logs are not enabled\n";
  const auto all = [](int mode) {
    return Lines{kEnabled, kHighThroughput, kMode, baseband(kByUser, mode)};
  };
  expectRuns("bb", "RADIO_DIAG_QDSS=yes\nBaseband.TraceEnabled=yes\nBaseband.TraceHighThroughput=no\n", {
      {"", {}, all(0), success + "log-bb-T-diag\n", 0, {"log-bb-T-diag"}},
      {"Baseband.TraceHighThroughput=LITE", {"nonui", "why", "tar"},
       {kEnabled, kHighThroughput, kMode, baseband("[velltool] why", 0)},
       success + "log-bb-T-qdss\n", 0, {"log-bb-T-qdss"}},
      {"RADIO_VENDOR=2\nBaseband.TraceHighThroughput=1", {}, all(0),
       success + "log-bb-T-bb-trace\n", 0, {"log-bb-T-bb-trace"}},
      {"RADIO_DIAG_QDSS=no\nBaseband.TraceHighThroughput=yes", {"TAR"},
       {kEnabled, kMode, baseband(kByUser, 2)}, success + "log-bb-T.tar\n", 0, {"log-bb-T.tar"}},
      {"GET_TRACE_PROPERTY.Baseband.TraceHighThroughput=status:7", {"tar.gz"}, all(1),
       success + "log-bb-T.tar.gz\n", 0, {"log-bb-T.tar.gz"}},
      {"Baseband.TraceHighThroughput_TYPE=no-dictionary\nSystemLogs.TraceMode=3", {"tar.gz"},
       all(0), success + "log-bb-T-diag\n", 0, {"log-bb-T-diag"}},
      {"COMPRESSION_SUPPORTED=no\nDEFAULT_COMPRESSION=tar", {}, all(0), success + "log-bb-T-diag\n",
       0, {"log-bb-T-diag"}},
      {"TIMESTAMP=", {}, all(0), success + "log-bb--diag\n", 0, {"log-bb--diag"}},
      {"TIMESTAMP_TYPE=missing", {"tar"}, all(2), success + "log-bb-.tar\n", 0, {"log-bb-.tar"}},
      {"TIMESTAMP_TYPE=integer", {}, all(0), success + "log-bb--diag\n", 0, {"log-bb--diag"}},
      {"TRACE_DUMP_STATE=no-dictionary", {}, all(0), success + "log-bb--diag\n", 0,
       {"log-bb-T-diag"}},
      {"TRACE_DUMP_STATE=status:1", {}, all(0), failure, 0, {}},
      {"TRACE_DUMP_STATE=wrong-signature", {}, all(0), failure, 0, {}},
      {"TRACE_DUMP_STATE=die", {}, all(0), failure, 0, {}},
      {"Baseband.TraceEnabled=12abc", {}, {kEnabled}, off, 0, {}},
      {"Baseband.TraceEnabled=", {}, {kEnabled}, off, 0, {}},
      {"Baseband.TraceEnabled_TYPE=missing", {}, {kEnabled}, off, 0, {}},
      {"Baseband.TraceEnabled_TYPE=boolean", {}, {kEnabled}, off, 0, {}},
      {"Baseband.TraceEnabled=' 0x10'", {}, all(0), success + "log-bb-T-diag\n", 0,
       {"log-bb-T-diag"}},
      {"GET_TRACE_PROPERTY=no-dictionary", {}, {kEnabled}, failure, 0, {}},
      {"GET_TRACE_PROPERTY=status:3", {}, {kEnabled}, failure, 1, {}},
      {"GET_TRACE_PROPERTY=wrong-signature", {}, {kEnabled}, failure, 1, {}},
      {"GET_TRACE_PROPERTY=die", {}, {kEnabled}, failure, 1, {}},
      // The state of the server does not matter to this command.
      {"SERVER_STATE=Starting", {}, all(0), success + "log-bb-T-diag\n", 0, {"log-bb-T-diag"}},
  });
}

TEST(Collection, OfBasebandLogsThatAManagerLeftBehind) {
  const std::string success = "Baseband log collection: Success (Vell not running)\n";
  const std::string scratch = success + kScratch + "DIAG.scratch\n";
  const std::string snapshot = success + kFolder + "log-bb-H-diag\n";
  expectRuns("bb",
      "MANAGER=absent\nINTERNAL_BUILD=yes\nRADIO_DIAG_QDSS=yes\nHELPER_TIMESTAMP=H\n"
      "Baseband.TraceEnabled=yes\nBaseband.TraceHighThroughput=no\n", {
      {"", {"tar"}, {kHelper}, snapshot, 0, {"log-bb-H-diag"}},
      {"INTERNAL_BUILD=no\nCARRIER_BUILD=yes\nBaseband.TraceHighThroughput=on", {}, {kHelper},
       success + kFolder + "log-bb-H-qdss\n", 0, {"log-bb-H-qdss"}},
      {"RADIO_VENDOR=2", {}, {kHelper}, success + kFolder + "log-bb-H-bb-trace\n", 0,
       {"log-bb-H-bb-trace"}},
      {"INTERNAL_BUILD=no", {}, {}, scratch, 0, {}},
      {"INTERNAL_BUILD=no\nRADIO_VENDOR=2\nBaseband.TraceHighThroughput=yes", {}, {},
       success + kScratch + "QDSS.scratch\n", 0, {}},
      {"HELPER=absent", {}, {}, scratch, 0, {}},
      {"HELPER_TIMESTAMP=", {}, {kHelper}, scratch, 0, {}},
      {"HELPER_TIMESTAMP_TYPE=integer", {}, {kHelper}, scratch, 0, {}},
      {"HELPER_TIMESTAMP_TYPE=missing", {}, {kHelper}, scratch, 0, {}},
      {"HELPER_ANSWER=status:1", {}, {kHelper}, scratch, 0, {}},
      {"HELPER_ANSWER=no-dictionary", {}, {kHelper}, scratch, 0, {"log-bb-H-diag"}},
      {"HELPER_ANSWER=wrong-signature", {}, {kHelper}, scratch, 0, {}},
      {"HELPER_ANSWER=die", {}, {kHelper}, scratch, 0, {}},
      {"BUS=no", {}, {}, scratch, 0, {}},
      {"Baseband.TraceEnabled=0", {}, {}, "Baseband logs are not enabled\n", 0, {}},
      {"SAVED_TRACES=no", {}, {}, "Baseband log collection: Failed\n", 1, {}},
      {"MANAGER=running\nTRACE_DUMP_STATE=status:0xE020E001", {},
       {kEnabled, kHighThroughput, kMode, baseband(kByUser, 0), kHelper}, snapshot, 0,
       {"log-bb-H-diag"}},
      {"MANAGER=running\nGET_TRACE_PROPERTY.Baseband.TraceHighThroughput=die", {},
       {kEnabled, kHighThroughput, kHelper}, snapshot, 0, {"log-bb-H-diag"}},
  });
}

// clang-format on
