// The simulator by itself, seen by a client that shares nothing with the tool's own.

#include "platform/linux/bus_dictionary.h"
#include "platform/linux/bus_handles.h"
#include "simulator/request_text.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <stdexcept>

namespace {

using Lines = std::vector<std::string>;

MessageDict dict(std::initializer_list<MessageDict::Entry> entries) {
  MessageDict made;
  for (const auto& [key, value] : entries) {
    made.set(key, value);
  }
  return made;
}

/// A client on the bus of a device: what it gets is turned into text.
class BusClient {
 public:
  explicit BusClient(const SimulatedDevice& device) {
    sd_bus* opened = nullptr;
    check(sd_bus_new(&opened));
    bus.reset(opened);
    check(sd_bus_set_address(opened, device.busAddress().c_str()));
    check(sd_bus_set_bus_client(opened, 1));
    check(sd_bus_start(opened));
  }

  /// Calls the manager; gives the status, the message and the reply, or the name of the error.
  std::string command(const std::string& name, const MessageDict& request) {
    const auto call = newCall("org.vell.Manager1", "/org/vell/Manager1", "PerformCommand");
    check(sd_bus_message_append(call.get(), "s", name.c_str()));
    return answer(call, request, true);
  }

  std::string property(const std::string& trace, const std::string& name) {
    return command("GetTraceProperty", dict({{"TraceName", trace}, {"TracePropertyName", name}}));
  }

  /// Calls the helper; gives the status and the reply, or the name of the error.
  std::string askHelper(const std::string& name) {
    const auto call = newCall("org.vell.Helper1", "/org/vell/Helper1", "Perform");
    check(sd_bus_message_append(call.get(), "us", 4U, name.c_str()));
    return answer(call, dict({{"Timeout", std::int64_t{1500}}}), false);
  }

  /// Sends a command and does not wait for an answer.
  void send(const std::string& name, const MessageDict& request) {
    const auto call = newCall("org.vell.Manager1", "/org/vell/Manager1", "PerformCommand");
    check(sd_bus_message_append(call.get(), "s", name.c_str()));
    ASSERT_TRUE(appendDictionary(call.get(), request));
    check(sd_bus_call_async(bus.get(), nullptr, call.get(), noteAnswer, this, UINT64_MAX));
    check(sd_bus_flush(bus.get()));
  }

  /// The manager's state: its type and, for a string, its value.
  std::string serverState() {
    BusError error;
    sd_bus_message* reply = nullptr;
    check(sd_bus_call_method(bus.get(), "org.vell.Manager1", "/org/vell/Manager1",
                             "org.freedesktop.DBus.Properties", "Get", error.get(), &reply, "ss",
                             "org.vell.Manager1", "ServerState"));
    const BusMessagePtr owner(reply);
    const char* contents = nullptr;
    check(sd_bus_message_peek_type(reply, nullptr, &contents));
    const std::string type = contents;
    const char* text = "";
    if (type == "s") {
      check(sd_bus_message_read(reply, "v", "s", &text));
    }
    return type + " " + text;
  }

  /// From now on notes the events, and the coming and going of the manager.
  void follow() {
    check(sd_bus_match_signal(bus.get(), nullptr, nullptr, "/org/vell/Manager1",
                              "org.vell.Manager1", "Event", noteEvent, this));
    check(sd_bus_match_signal(bus.get(), nullptr, "org.freedesktop.DBus", nullptr,
                              "org.freedesktop.DBus", "NameOwnerChanged", noteOwner, this));
  }

  /// The next thing noted.
  std::string next() {
    const auto patience = std::chrono::steady_clock::now() + std::chrono::minutes(1);
    while (noted.empty()) {
      if (std::chrono::steady_clock::now() > patience) {
        throw std::runtime_error("nothing came on the bus");
      }
      if (sd_bus_process(bus.get(), nullptr) == 0) {
        check(sd_bus_wait(bus.get(), 1'000'000));
      }
    }
    auto first = noted.front();
    noted.erase(noted.begin());
    return first;
  }

 private:
  static void check(int result) {
    if (result < 0) {
      throw std::system_error(-result, std::generic_category(), "sd-bus");
    }
  }

  BusMessagePtr newCall(const char* name, const char* path, const char* member) {
    sd_bus_message* call = nullptr;
    check(sd_bus_message_new_method_call(bus.get(), &call, name, path, name, member));
    BusMessagePtr owner(call);
    check(sd_bus_message_set_auto_start(call, 0));
    return owner;
  }

  static std::string textOf(sd_bus_message* reply, bool withMessage) {
    std::int32_t status = 0;
    const char* message = "";
    MessageDict answered;
    if (!sd_bus_message_has_signature(reply, withMessage ? "isv" : "iv")) {
      return std::string("signature ") + sd_bus_message_get_signature(reply, 1);
    }
    check(sd_bus_message_read(reply, "i", &status));
    if (withMessage) {
      check(sd_bus_message_read(reply, "s", &message));
    }
    EXPECT_TRUE(readPayload(reply, answered));
    return std::to_string(status) + " " + (withMessage ? simulator::quoted(message) + " " : "") +
           (answered.isDictionary() ? simulator::describe(answered) : "no dictionary");
  }

  std::string answer(const BusMessagePtr& call, const MessageDict& request, bool withMessage) {
    EXPECT_TRUE(appendDictionary(call.get(), request));
    BusError error;
    sd_bus_message* reply = nullptr;
    constexpr std::uint64_t kPatience = 60'000'000;
    if (sd_bus_call(bus.get(), call.get(), kPatience, error.get(), &reply) < 0) {
      return error.get()->name;
    }
    const BusMessagePtr owner(reply);
    return textOf(reply, withMessage);
  }

  static int noteAnswer(sd_bus_message* reply, void* userdata, sd_bus_error* /*error*/) {
    const auto* const error = sd_bus_message_get_error(reply);
    static_cast<BusClient*>(userdata)->noted.push_back(error != nullptr ? error->name
                                                                        : textOf(reply, true));
    return 0;
  }

  static int noteEvent(sd_bus_message* event, void* userdata, sd_bus_error* /*error*/) {
    const char* name = nullptr;
    MessageDict payload;
    check(sd_bus_message_read(event, "s", &name));
    EXPECT_TRUE(readPayload(event, payload));
    static_cast<BusClient*>(userdata)->noted.push_back(
        std::string(name) + " " +
        (payload.isDictionary() ? simulator::describe(payload) : "no dictionary"));
    return 0;
  }

  static int noteOwner(sd_bus_message* change, void* userdata, sd_bus_error* /*error*/) {
    const char* name = nullptr;
    const char* before = nullptr;
    const char* after = nullptr;
    check(sd_bus_message_read(change, "sss", &name, &before, &after));
    if (std::string(name) == "org.vell.Manager1") {
      static_cast<BusClient*>(userdata)->noted.emplace_back(*after == '\0' ? "gone" : "come");
    }
    return 0;
  }

  BusPtr bus;
  Lines noted;
};

const std::string kNoReply = "org.freedesktop.DBus.Error.NoReply";
const std::string kNoOwner = "org.freedesktop.DBus.Error.NameHasNoOwner";

MessageDict dump(const std::string& action, std::int64_t compression) {
  return dict({{"TraceAction", action}, {"TraceDumpStatePerformCompression", compression}});
}

ProcessResult runSimulator(const std::vector<std::string>& words) {
  return startSimulator(words).finish();
}

}  // namespace

TEST(Simulator, AnswersAsTheProfileSays) {
  const SimulatedDevice device(
      "A.String=\"a \\\"b\\\"\"\nA.Integer_TYPE=integer\nA.Boolean_TYPE=boolean\n"
      "A.Other_TYPE=other\nA.Missing=x\nA.Missing_TYPE=missing\nA.None_TYPE=no-dictionary\n"
      "A.Fine=1\nTIMESTAMP=T\nHELPER_TIMESTAMP=H\n"
      "GET_TRACE_PROPERTY=\"status:0xE020E001 no-dictionary\"\n"
      "GET_TRACE_PROPERTY.A.String=answer\nGET_TRACE_PROPERTY.A.Integer=slow:1\n"
      "GET_TRACE_PROPERTY.A.Boolean=answer\nGET_TRACE_PROPERTY.A.Other=answer\n"
      "GET_TRACE_PROPERTY.A.Missing=answer\nGET_TRACE_PROPERTY.A.None=answer\n"
      "GET_TRACE_PROPERTY.A.Signature=wrong-signature\nGET_TRACE_PROPERTY.A.Unknown=answer\n");
  BusClient client(device);
  EXPECT_EQ(client.property("A", "String"), R"(0 "" {TracePropertyValue: s "a \"b\""})");
  EXPECT_EQ(client.property("A", "Integer"), R"(0 "" {TracePropertyValue: x 1})");
  EXPECT_EQ(client.property("A", "Boolean"), R"(0 "" {TracePropertyValue: b true})");
  EXPECT_EQ(client.property("A", "Other"), R"(0 "" {TracePropertyValue: ?})");
  EXPECT_EQ(client.property("A", "Missing"), R"(0 "" {})");
  EXPECT_EQ(client.property("A", "Unknown"), R"(0 "" {})");
  EXPECT_EQ(client.property("A", "None"), R"(0 "" no dictionary)");
  EXPECT_EQ(client.property("A", "Signature"), "signature s");
  EXPECT_EQ(client.property("A", "Fine"),
            R"(-534716415 "failed as the profile says" no dictionary)");
  EXPECT_EQ(client.command("Nonsense", {}), R"(-534716414 "unknown command Nonsense" {})");
  EXPECT_EQ(client.command("TraceDumpState", dump("X", 0)),
            R"(-534716413 "unknown trace action X" {})");
  EXPECT_EQ(client.askHelper("TidewellStatus"), R"(0 {TimestampString: s "H"})");
  EXPECT_EQ(client.askHelper("Nonsense"), "-534716414 {}");
  EXPECT_EQ(device.requests("helper"), (Lines{"Perform 4 TidewellStatus {Timeout: x 1500}",
                                              "Perform 4 Nonsense {Timeout: x 1500}"}));
}

TEST(Simulator, WritesTheCollections) {
  const struct {
    std::string profile;
    std::string action;
    std::int64_t compression;
    Lines collections;
  } cases[] = {
      {"", "CollectTelephonyLogs", 0, {"log-bb-T-state", "log-bb-T-telephony"}},
      {"", "CollectTelephonyLogs", 7, {"log-bb-T-state", "log-bb-T-telephony"}},
      {"", "CollectTelephonyLogs", 1, {"log-bb-T.tar.gz"}},
      {"", "CollectTelephonyLogs", 2, {"log-bb-T.tar"}},
      {"", "CollectTelephonyLogsWithCoredump", 0, {"log-bb-T-cd", "log-bb-T-telephony"}},
      {"RADIO_VENDOR=2\n",
       "CollectTelephonyLogsWithCoredump",
       0,
       {"log-bb-T-coredump", "log-bb-T-telephony"}},
      {"", "CollectBasebandLogs", 0, {"log-bb-T-diag"}},
      {"RADIO_DIAG_QDSS=yes\nBaseband.TraceHighThroughput=0x10\n",
       "CollectBasebandLogs",
       0,
       {"log-bb-T-qdss"}},
      {"Baseband.TraceHighThroughput=yes\n", "CollectBasebandLogs", 0, {"log-bb-T-diag"}},
      {"RADIO_DIAG_QDSS=yes\nBaseband.TraceHighThroughput=off\n",
       "CollectBasebandLogs",
       0,
       {"log-bb-T-diag"}},
      {"RADIO_VENDOR=2\n", "CollectBasebandLogs", 0, {"log-bb-T-bb-trace"}},
      {"TRACE_DUMP_STATE=status:1\n", "CollectTelephonyLogs", 0, {}},
  };
  for (const auto& [profile, action, compression, collections] : cases) {
    SCOPED_TRACE(profile + action + std::to_string(compression));
    const SimulatedDevice device(profile + "TIMESTAMP=T\n");
    BusClient(device).command("TraceDumpState", dump(action, compression));
    EXPECT_EQ(device.collections(), collections);
    if (compression == 1 || compression == 2) {
      const auto archive = device.root() /
                           "private/var/wireless/Library/Logs/Faultkeeper/Baseband" /
                           collections.front();
      const auto listing =
          TestProcess({{"/bin/tar", "--list", "--file", archive.string()}, {}, "", false}).finish();
      EXPECT_EQ(listing, (ProcessResult{0,
                                        "log-bb-T-telephony/\nlog-bb-T-telephony/request.txt\n"
                                        "log-bb-T-state/\nlog-bb-T-state/request.txt\n",
                                        ""}));
    }
  }
}

TEST(Simulator, MakesTheDeviceOfTheProfile) {
  const SimulatedDevice device(
      "PROCESSES=\"Linkward a-very-long-process-name\"\nBUS=no\nA.B=\"x \\\\y\"\n# end\n");
  EXPECT_EQ(contentOf(device.root() / "etc/vell/device.conf"),
            "PROCESSES=\"Linkward a-very-long-process-name\"\nBUS=no\nA.B=\"x \\\\y\"\n# end\n");
  EXPECT_EQ(contentOf(device.root() / "var/lib/vell/traces.conf"), "A.B=\"x \\\\y\"\n");
  EXPECT_EQ(contentOf(device.root() / "proc/100/comm"), "Linkward\n");
  EXPECT_EQ(contentOf(device.root() / "proc/101/comm"), "a-very-long-pro\n");
  EXPECT_EQ(std::filesystem::read_symlink(device.root() / "proc/101/exe").filename(),
            "a-very-long-process-name");
  EXPECT_TRUE(std::filesystem::is_directory(
      device.root() / "private/var/wireless/Library/Logs/VellManager/QDSS.scratch"));
  EXPECT_THROW(BusClient client(device), std::system_error);
}

TEST(Simulator, LogsARequestBeforeItActsOnIt) {
  const SimulatedDevice device("MANAGER=absent\nGET_TRACE_PROPERTY=silent\n");
  BusClient client(device);
  EXPECT_EQ(client.property("Baseband", "TraceEnabled"), kNoOwner);
  auto manager = device.serve("manager");
  client.send("GetTraceProperty", dict({{"z", "line\nbreak \"\\"},
                                        {"a", std::int64_t{-7}},
                                        {"b", false},
                                        {"o", MessageDict::OtherType{}}}));
  EXPECT_EQ(
      manager.readLine(),
      R"(PerformCommand GetTraceProperty {z: s "line\x0abreak \"\\", a: x -7, b: b false, o: ?})");
  manager.sendSignal(SIGKILL);
  EXPECT_EQ(client.next(), kNoReply);
  EXPECT_EQ(manager.finish().status, 128 + SIGKILL);
}

TEST(Simulator, DiesAndRestartsInMidRequest) {
  SimulatedDevice device(
      "TIMESTAMP=T\nGET_TRACE_PROPERTY=restart\nTRACE_DUMP_STATE=die\nHELPER_ANSWER=die\n");
  BusClient client(device);
  client.follow();
  EXPECT_EQ(client.property("A", "B"), kNoReply);
  EXPECT_EQ(client.next(), "gone");
  EXPECT_EQ(client.next(), "come");
  EXPECT_EQ(client.serverState(), "s Started");
  EXPECT_EQ(client.command("TraceDumpState", dump("CollectBasebandLogs", 0)), kNoReply);
  EXPECT_EQ(client.command("TraceDumpState", dump("CollectBasebandLogs", 0)), kNoOwner);
  EXPECT_EQ(client.askHelper("TidewellStatus"), kNoReply);
  EXPECT_EQ(client.askHelper("TidewellStatus"), kNoOwner);
  EXPECT_EQ(device.collections(), Lines{});
}

TEST(Simulator, HoldsASlowAnswerAndServesOthersMeanwhile) {
  const SimulatedDevice device("GET_TRACE_PROPERTY.A.Slow=slow:200\n");
  BusClient client(device);
  const auto start = std::chrono::steady_clock::now();
  client.send("GetTraceProperty", dict({{"TraceName", "A"}, {"TracePropertyName", "Slow"}}));
  EXPECT_EQ(client.property("A", "Quick"), R"(0 "" {})");
  EXPECT_EQ(client.next(), R"(0 "" {})");
  EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(200));
}

TEST(Simulator, SpeaksOfItsState) {
  const struct {
    std::string profile;
    std::string state;
    std::string event;
  } cases[] = {
      {"", "s Started", R"({ServerState: s "Stopped"})"},
      {"SERVER_STATE=started\n", "s started", R"({ServerState: s "Stopped"})"},
      {"SERVER_STATE_TYPE=integer\n", "x ", "{ServerState: x 1}"},
      {"SERVER_STATE_TYPE=missing\n", "x ", "{}"},
      {"SERVER_STATE_TYPE=no-dictionary\n", "x ", "no dictionary"},
  };
  for (const auto& [profile, state, event] : cases) {
    SCOPED_TRACE(profile);
    const SimulatedDevice device(profile + "MANAGER=absent\n");
    auto manager = device.serve("manager");
    BusClient client(device);
    client.follow();
    EXPECT_EQ(client.serverState(), state);
    manager.write("nonsense\nevent Else Odd\n");
    manager.write("state Stopped\n");
    EXPECT_TRUE(client.next().starts_with("Else "));
    EXPECT_EQ(client.next(), "ServerStateChange " + event);
    EXPECT_TRUE(manager.readLine().starts_with("Event Else "));
    EXPECT_TRUE(manager.readLine().starts_with("Event ServerStateChange "));
    EXPECT_EQ(client.serverState(), state.starts_with("s") ? "s Stopped" : state);
  }
}

TEST(Simulator, GivesTheStatusOfItsCommand) {
  EXPECT_EQ(runSimulator({"--", "/bin/sh", "-c", "echo out; echo err >&2; exit 7"}),
            (ProcessResult{7, "out\n", "err\n"}));
  EXPECT_EQ(runSimulator({"--", "/bin/sh", "-c", "kill -KILL $$"}),
            (ProcessResult{128 + SIGKILL, "", ""}));
  EXPECT_EQ(
      runSimulator({"--", "/no/such/program"}),
      (ProcessResult{127, "", "vell-simulator: /no/such/program: No such file or directory\n"}));
}

TEST(Simulator, RefusesWhatItCannotRead) {
  const std::string usage =
      "; usage: vell-simulator [PROFILE] [-- COMMAND...] | --serve bus|manager|helper [LOGFILE]\n";
  const TemporaryFile profile(
      "not a line\nBUS=maybe\nTIMESTAMP=a/b\nTIMESTAMP_TYPE=text\nHELPER_ANSWER=slow:-1\n");
  const auto place = "vell-simulator: " + profile.path();
  const struct {
    std::vector<std::string> words;
    int status;
    std::string errors;
  } cases[] = {
      {{"a", "b"}, 2, "vell-simulator: more than one profile" + usage},
      {{"--help"}, 2, "vell-simulator: \"--help\" is no profile" + usage},
      {{"--"}, 2, "vell-simulator: no command after --" + usage},
      {{"--serve", "x"}, 2, "vell-simulator: no service is called \"x\"" + usage},
      {{"--serve"}, 2, "vell-simulator: --serve takes a service and perhaps a file" + usage},
      {{"--serve", "manager"}, 1, "vell-simulator: --serve works inside a simulated device only\n"},
      {{"/no/file", "--", "/bin/true"}, 1, "vell-simulator: /no/file: No such file or directory\n"},
      {{profile.path(), "--", "/bin/true"},
       1,
       place + ":1: not a KEY=value line\n" + place + ":2: BUS: \"maybe\" is not yes or no\n" +
           place +
           ":4: TIMESTAMP_TYPE: \"text\" is not string, integer, boolean, other, missing or "
           "no-dictionary\n" +
           place + ":3: TIMESTAMP: \"a/b\" is not a part of a file name\n" + place +
           ":5: HELPER_ANSWER: \"slow:-1\" is not made of answer, no-dictionary, wrong-signature, "
           "silent, die, restart, status:NUMBER and slow:MILLISECONDS\n"},
  };
  for (const auto& [words, status, errors] : cases) {
    EXPECT_EQ(runSimulator(words), (ProcessResult{status, "", errors}));
  }
}

TEST(Simulator, CleansUpHoweverItEnds) {
  for (const int signalNumber : {0, SIGINT, SIGTERM, SIGHUP}) {
    SCOPED_TRACE(signalNumber);
    SimulatedDevice device("");
    BusClient client(device);
    if (signalNumber != 0) {
      device.simulator().sendSignal(signalNumber);
    }
    const auto result =
        signalNumber == 0 ? device.simulator().finish() : device.simulator().await();
    EXPECT_EQ(result, (ProcessResult{signalNumber == 0 ? 0 : 128 + signalNumber, "", ""}));
    EXPECT_FALSE(std::filesystem::exists(device.root()));
    EXPECT_THROW(BusClient late(device), std::system_error);
  }
}
