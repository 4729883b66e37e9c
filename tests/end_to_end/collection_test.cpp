// Each way in which a collection can end: what is asked of the manager and of its helper, what is
// printed, and what lies on disk.

#include "simulator/request_text.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

namespace {

/// A profile, words as the shell takes them, and what comes of it: the requests, what is printed,
/// the status if it is not 0, and what lies there.
struct Case {
  std::string profile;
  std::string words;
  std::string expected;
};

/// That the collection log-bb-`name` is printed and lies there.
std::string path(const std::string& name) {
  return kCollectionPath + "log-bb-" + name + "\nlog-bb-" + name + "\n";
}

std::string query(const std::string& trace, const std::string& property) {
  return "PerformCommand GetTraceProperty {TraceName: s \"" + trace +
         "\", TracePropertyName: s \"" + property + "\"}\n";
}

const std::string kMode = query("SystemLogs", "TraceMode");
const std::string kEnabled = query("Baseband", "TraceEnabled");
const std::string kHighThroughput = query("Baseband", "TraceHighThroughput");
const std::string kHelper = "Perform 4 TidewellStatus {Timeout: x 1500}\n";
const std::string kByUser = "User triggered";

/// The request for a collection: the keys up to the reason, and those up to the compression.
std::string dump(const std::string& keys, const std::string& reason, const std::string& mode,
                 const std::string& moreKeys = "") {
  return "PerformCommand TraceDumpState {" + keys + ": s " +
         simulator::quoted("[velltool] " + reason) + ", " + moreKeys +
         "TraceDumpStatePerformCompression: x " + mode + "}\n";
}

void expectRuns(const std::string& command, const std::string& profile,
                const std::vector<Case>& cases) {
  forEachAtOnce(cases, [&](const Case& row) {
    const auto& [ownProfile, words, expected] = row;
    SCOPED_TRACE(ownProfile + "\n" + words.substr(0, 100));
    // The keys of the case come last, and a later line counts before an earlier one.
    const SimulatedDevice device("RADIO_TYPE=1\nTIMESTAMP=T\n" + profile + ownProfile);
    // Help comes behind it, and shows that its last line was out before.
    const auto [status, output, errors] =
        device.runTool("logdump " + command + " " + words + " -- logdump help");
    const auto help = status == 0 ? output.find("\nOptions") : output.size();
    EXPECT_EQ(errors, "");
    EXPECT_EQ(device.requests() + output.substr(0, help) +
                  (status == 0 ? "" : "status " + std::to_string(status) + "\n") +
                  device.collections(),
              expected);
  });
}

std::string telephony(const std::string& mode, const std::string& reason = kByUser) {
  return kMode +
         dump("TraceAction: s \"CollectTelephonyLogs\", TraceDumpStateReason", reason, mode);
}

std::string core(const std::string& mode, const std::string& reason = kByUser) {
  return dump(
      "BasebandResetType: s \"Hard\", BasebandResetSubType: s \"OtherErrors\", "
      "TraceAction: s \"CollectTelephonyLogsWithCoredump\", BasebandResetReason",
      reason, mode);
}

std::string baseband(const std::string& mode, const std::string& reason = kByUser) {
  return kMode +
         dump("TraceDumpStateReason", reason, mode, "TraceAction: s \"CollectBasebandLogs\", ");
}

}  // namespace

TEST(Collection, TelTableOfOutcomes) {
  const std::string success = "Telephony log collection: Success\n";
  const std::string failure = "Telephony log collection: Failed\n";
  const std::string open =
      success + kCollectionPath + "log-bb-T-*\nlog-bb-T-state\nlog-bb-T-telephony\n";
  const std::string quiet = ", TraceUserConfirmation: b false";
  const std::string longWord(100000, 'x');
  // clang-format off
  expectRuns("tel", "", {
      {"", "", telephony("0") + open},
      {"", "Tar.Gz nonui my tar", telephony("1" + quiet, "my") + success + path("T.tar.gz")},
      {"SystemLogs.TraceMode=3", "tar", telephony("0") + open},
      {"SystemLogs.TraceMode=3\nSystemLogs.TraceMode_TYPE=integer", "tar",
       telephony("2") + success + path("T.tar")},
      {"SystemLogs.TraceMode_TYPE=other\nTIMESTAMP_TYPE=other", "tar",
       telephony("2") + success + path(".tar")},
      {"DEFAULT_COMPRESSION=7\nCOMPRESSION_SUPPORTED=no", "", telephony("7") + open},
      {"GET_TRACE_PROPERTY=wrong-signature", "", telephony("0") + open},
      {"SystemLogs.TraceMode=3\nGET_TRACE_PROPERTY=status:7", "tar",
       telephony("2") + success + path("T.tar")},
      {"TRACE_DUMP_STATE=no-dictionary", "",
       telephony("0") + success + "log-bb-T-state\nlog-bb-T-telephony\n"},
      {"TRACE_DUMP_STATE=status:0xE020E001", "", telephony("0") + failure},
      {"TRACE_DUMP_STATE=wrong-signature", "", telephony("0") + failure},
      {"TRACE_DUMP_STATE=die", "", telephony("0") + failure},
      {"GET_TRACE_PROPERTY=die", "", kMode + failure},
      // Bytes that the bus does not carry, line breaks, words of many kilobytes.
      {"", "$'a\xFF\xC3z\n'", telephony("0", "a\xEF\xBF\xBD\xEF\xBF\xBDz\n") + open},
      {"", longWord + " ''", telephony("0", longWord) + open},
  });
  // clang-format on
}

TEST(Collection, CoreTableOfOutcomes) {
  const std::string title = "Telephony log collection with Coredump: ";
  const std::string success = title + "Success\n";
  // clang-format off
  expectRuns("core", "DEFAULT_COMPRESSION=tar.gz\nSystemLogs.TraceMode=3\n", {
      {"", "'' tar", core("1", "") + success + path("T.tar.gz")},
      {"", "nocompress", core("0") + success + path("T-cd") + "log-bb-T-telephony\n"},
      {"RADIO_VENDOR=2\nDEFAULT_COMPRESSION=nocompress", "NONUI",
       core("0, TraceUserConfirmation: b false") + success + path("T-coredump") +
       "log-bb-T-telephony\n"},
      {"TRACE_DUMP_STATE=status:-2147483648", "", core("1") + title + "Failed\n"},
  });
  // clang-format on
}

TEST(Collection, BbTableOfOutcomesWithARunningManager) {
  const std::string success = "Baseband log collection: Success (Vell running)\n";
  const std::string failure = "Baseband log collection: Failed\n";
  const std::string off = "Baseband logs are not enabled\n";
  const std::string both = kEnabled + kHighThroughput;
  const std::string all = both + baseband("0");
  const std::string diag = success + path("T-diag");
  // clang-format off
  expectRuns("bb",
      "RADIO_DIAG_QDSS=yes\nBaseband.TraceEnabled=yes\nBaseband.TraceHighThroughput=no\n", {
      // The state of the server does not matter to this command.
      {"SERVER_STATE=Starting", "", all + diag},
      {"Baseband.TraceHighThroughput=LITE", "nonui why tar",
       both + baseband("0", "why") + success + path("T-qdss")},
      {"RADIO_VENDOR=2\nBaseband.TraceHighThroughput=1", "", all + success + path("T-bb-trace")},
      {"RADIO_VENDOR=3\nRADIO_DIAG_QDSS=no\nBaseband.TraceHighThroughput=yes", "",
       kEnabled + baseband("0") + diag},
      {"Baseband.TraceHighThroughput=yes\n"
       "GET_TRACE_PROPERTY.Baseband.TraceHighThroughput=status:7", "",
       all + success + kCollectionPath + "log-bb-T-diag\nlog-bb-T-qdss\n"},
      {"Baseband.TraceHighThroughput_TYPE=no-dictionary\nSystemLogs.TraceMode=3", "tar.gz",
       all + diag},
      {"COMPRESSION_SUPPORTED=no\nDEFAULT_COMPRESSION=tar\nTIMESTAMP=", "",
       all + success + path("-diag")},
      {"TIMESTAMP_TYPE=missing", "TAR", both + baseband("2") + success + path(".tar")},
      {"TIMESTAMP_TYPE=integer\nBaseband.TraceEnabled=' 0x10'", "", all + success + path("-diag")},
      {"TRACE_DUMP_STATE=no-dictionary", "",
       all + success + kCollectionPath + "log-bb--diag\nlog-bb-T-diag\n"},
      {"TRACE_DUMP_STATE=status:1", "", all + failure},
      {"TRACE_DUMP_STATE=wrong-signature", "", all + failure},
      {"TRACE_DUMP_STATE=die", "", all + failure},
      {"Baseband.TraceEnabled=12abc", "", kEnabled + off},
      {"Baseband.TraceEnabled_TYPE=missing", "", kEnabled + off},
      {"Baseband.TraceEnabled_TYPE=boolean", "", kEnabled + off},
      {"GET_TRACE_PROPERTY=no-dictionary", "", kEnabled + failure},
      {"GET_TRACE_PROPERTY=status:3", "", kEnabled + failure + "status 1\n"},
      {"GET_TRACE_PROPERTY=wrong-signature", "", kEnabled + failure + "status 1\n"},
      {"GET_TRACE_PROPERTY=die", "", kEnabled + failure + "status 1\n"},
  });
  // clang-format on
}

TEST(Collection, BbTableOfOutcomesWithoutAManager) {
  const std::string success = "Baseband log collection: Success (Vell not running)\n";
  const std::string live = success + "Path = /private/var/wireless/Library/Logs/VellManager/";
  const std::string scratch = live + "DIAG.scratch\n";
  const std::string snapshot = kHelper + success + path("H-diag");
  const std::string both = kEnabled + kHighThroughput;
  // clang-format off
  expectRuns("bb",
      "MANAGER=absent\nINTERNAL_BUILD=yes\nRADIO_DIAG_QDSS=yes\nHELPER_TIMESTAMP=H\n"
      "Baseband.TraceEnabled=yes\nBaseband.TraceHighThroughput=no\n", {
      {"", "tar", snapshot},
      {"INTERNAL_BUILD=no\nCARRIER_BUILD=yes\nBaseband.TraceHighThroughput=on", "",
       kHelper + success + path("H-qdss")},
      {"RADIO_VENDOR=2", "", kHelper + success + path("H-bb-trace")},
      {"INTERNAL_BUILD=no", "", scratch},
      {"INTERNAL_BUILD=no\nRADIO_VENDOR=2\nBaseband.TraceHighThroughput=yes", "",
       live + "QDSS.scratch\n"},
      {"HELPER=absent", "", scratch},
      {"HELPER_TIMESTAMP=", "", kHelper + scratch},
      {"HELPER_TIMESTAMP_TYPE=integer", "", kHelper + scratch},
      {"HELPER_ANSWER=status:1", "", kHelper + scratch},
      {"HELPER_ANSWER=no-dictionary", "", kHelper + scratch + "log-bb-H-diag\n"},
      {"HELPER_ANSWER=wrong-signature", "", kHelper + scratch},
      {"HELPER_ANSWER=die", "", kHelper + scratch},
      {"HELPER_ANSWER=silent", "", kHelper + scratch},
      {"BUS=no", "", scratch},
      {"Baseband.TraceEnabled=0", "", "Baseband logs are not enabled\n"},
      {"SAVED_TRACES=no", "", "Baseband log collection: Failed\nstatus 1\n"},
      {"MANAGER=running\nTRACE_DUMP_STATE=status:0xE020E001", "", both + baseband("0") + snapshot},
      {"MANAGER=running\nGET_TRACE_PROPERTY.Baseband.TraceHighThroughput=die", "", both + snapshot},
      {"MANAGER=running\nGET_TRACE_PROPERTY.SystemLogs.TraceMode=die", "", both + kMode + snapshot},
  });
  // clang-format on
}
