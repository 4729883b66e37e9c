#include "simulator/service.h"

#include "platform/bus/bus_dictionary.h"
#include "platform/bus/bus_handles.h"
#include "platform/manager_names.h"
#include "platform/portable/handle.h"
#include "simulator/answer.h"
#include "simulator/complaint.h"
#include "simulator/device_root.h"
#include "simulator/request_text.h"

#include <sys/epoll.h>
#include <sys/stat.h>
#include <systemd/sd-bus.h>
#include <systemd/sd-event.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <iostream>
#include <list>
#include <sstream>
#include <string>
#include <string_view>
#include <utility>

namespace simulator {

namespace {

constexpr std::int32_t kStatusNotCollected = static_cast<std::int32_t>(0xE020E004U);

/// Where a service is found on the bus, and what its requests and replies look like.
struct Identity {
  const char* name;  ///< Of the service, and of its interface.
  const char* path;
  const char* method;       ///< The one that carries a request.
  bool takesTask;           ///< Whether a number comes before the command.
  bool repliesWithMessage;  ///< Whether a message comes between the status and the reply.
  Answer (*answer)(const Profile& profile, const std::string& command, const MessageDict& request);
};

constexpr Identity kManager = {
    "org.vell.Manager1", "/org/vell/Manager1", "PerformCommand", false, true, answerOfManager};
constexpr Identity kHelper = {"org.vell.Helper1", "/org/vell/Helper1", "Perform", true, false,
                              answerOfHelper};

using EventLoopPtr = HandlePtr<sd_event, sd_event_unref>;
using EventSourcePtr = HandlePtr<sd_event_source, sd_event_source_unref>;

/// What the services of the device share: a connection to its bus, a loop that serves it, and the
/// giving of answers.
class Service {
 public:
  Service(const Identity& ownIdentity, Profile describedDevice, std::filesystem::path deviceRoot)
      : profile(std::move(describedDevice)), identity(ownIdentity), root(std::move(deviceRoot)) {}

  /// Connects to the bus and owns the name. `table` describes the interface; its userdata is this
  /// object, as a Service. Complains and returns false when that is not possible.
  bool connect(const sd_bus_vtable* table) {
    sd_event* newLoop = nullptr;
    sd_bus* newBus = nullptr;
    int result = 0;
    const auto done = [&](int returned) { return (result = returned) >= 0; };
    const bool connected =
        done(sd_event_new(&newLoop)) && done(sd_bus_open_system(&newBus)) &&
        done(sd_bus_attach_event(newBus, newLoop, SD_EVENT_PRIORITY_NORMAL)) &&
        done(
            sd_bus_add_object_vtable(newBus, nullptr, identity.path, identity.name, table, this)) &&
        done(sd_bus_add_object(newBus, nullptr, identity.path, callArrived, this)) &&
        done(sd_bus_set_exit_on_disconnect(newBus, 1)) &&
        done(sd_bus_request_name(newBus, identity.name, 0));
    loop.reset(newLoop);
    bus.reset(newBus);
    if (!connected) {
      complain(std::string("cannot serve ") + identity.name + ": " + std::strerror(-result));
    }
    return connected;
  }

  /// Serves until the bus goes away. Returns the exit status of the process.
  int run() {
    std::cout << "ready" << std::endl;
    const int result = sd_event_loop(loop.get());
    if (result < 0) {
      complain(std::string(identity.name) + ": " + std::strerror(-result));
    }
    return result == 0 ? EXIT_SUCCESS : EXIT_FAILURE;
  }

  /// Handles requests, here and in the table; leaves all else to the table. Comes before the table
  /// as well, whose methods cannot reply with another signature than their own.
  static int callArrived(sd_bus_message* call, void* userdata, sd_bus_error* /*error*/) {
    auto& service = *static_cast<Service*>(userdata);
    const auto& own = service.identity;
    return sd_bus_message_is_method_call(call, own.name, own.method) > 0 ? service.serve(call) : 0;
  }

 protected:
  EventLoopPtr loop;
  BusPtr bus;
  Profile profile;

 private:
  /// A request that waits for its delay to pass.
  struct Pending {
    Service* service;
    BusMessagePtr call;
    Answer answer;
    std::string request;
    EventSourcePtr timer;
  };

  int serve(sd_bus_message* call) {
    std::string line = identity.method;
    std::uint32_t task = 0;
    if (identity.takesTask && sd_bus_message_read(call, "u", &task) >= 0) {
      line += " " + std::to_string(task);
    }
    const char* command = nullptr;
    MessageDict request;
    if (sd_bus_message_read(call, "s", &command) < 0 || !readDictionary(call, request)) {
      return -EBADMSG;
    }
    line += std::string(" ") + command + " " + describe(request);
    std::clog << line << std::endl;
    auto answer = identity.answer(profile, command, request);
    if (answer.delay.count() == 0) {
      return carryOut(call, std::move(answer), line);
    }
    const std::chrono::microseconds delay = answer.delay;
    held.push_back(
        {this, BusMessagePtr(sd_bus_message_ref(call)), std::move(answer), line, nullptr});
    sd_event_source* timer = nullptr;
    const int result = sd_event_add_time_relative(loop.get(), &timer, CLOCK_MONOTONIC,
                                                  static_cast<std::uint64_t>(delay.count()), 1,
                                                  delayPassed, &held.back());
    held.back().timer.reset(timer);
    return result < 0 ? result : 1;
  }

  static int delayPassed(sd_event_source* /*timer*/, std::uint64_t /*time*/, void* userdata) {
    auto& pending = *static_cast<Pending*>(userdata);
    auto& service = *pending.service;
    service.carryOut(pending.call.get(), std::move(pending.answer), pending.request);
    service.held.remove_if([&](const Pending& other) { return &other == &pending; });
    return 0;
  }

  int carryOut(sd_bus_message* call, Answer answer, const std::string& request) const {
    if (answer.collection && !writeCollection(root, *answer.collection, request)) {
      answer.status = kStatusNotCollected;
      answer.message = "the collection could not be written";
      answer.reply = MessageDict();
    }
    switch (answer.conduct) {
      case Conduct::Reply:
        return reply(call, answer);
      case Conduct::WrongSignature:
        return sd_bus_reply_method_return(call, "s", "not what the interface says");
      case Conduct::Silent:
        return 1;
      case Conduct::Die:
        _exit(kStatusDied);
      case Conduct::Restart:
        _exit(kStatusRestart);
    }
    return -EINVAL;
  }

  int reply(sd_bus_message* call, const Answer& answer) const {
    sd_bus_message* newReply = nullptr;
    const int created = sd_bus_message_new_method_return(call, &newReply);
    const BusMessagePtr message(newReply);
    const bool complete = created >= 0 &&
                          sd_bus_message_append(newReply, "i", answer.status) >= 0 &&
                          (!identity.repliesWithMessage || appendText(newReply, answer.message)) &&
                          appendPayload(newReply, answer.reply);
    return complete ? sd_bus_send(nullptr, newReply, nullptr) : -ENOMEM;
  }

  const Identity& identity;
  const std::filesystem::path root;
  std::list<Pending> held;
};

/// The manager: what it has besides requests.
class Manager : public Service {
 public:
  using Service::Service;

  bool connect() {
    // A state that is to be no text is an integer on the bus, and says so when it is asked.
    const char* const stateType = textIn(profile.serverState) != nullptr ? "s" : "x";
    static const sd_bus_vtable kTable[] = {
        SD_BUS_VTABLE_START(0),
        SD_BUS_METHOD_WITH_ARGS("OpenClient", SD_BUS_ARGS("s", clientName), SD_BUS_NO_RESULT,
                                openClient, 0),
        SD_BUS_METHOD_WITH_ARGS("PerformCommand", SD_BUS_ARGS("s", command, "a{sv}", request),
                                SD_BUS_RESULT("i", status, "s", message, "v", reply), callArrived,
                                0),
        SD_BUS_SIGNAL_WITH_ARGS("Event", SD_BUS_ARGS("s", name, "v", payload), 0),
        SD_BUS_PROPERTY("ServerState", stateType, getServerState, 0, 0),
        SD_BUS_VTABLE_END,
    };
    return Service::connect(kTable) && takeControl();
  }

 private:
  static int openClient(sd_bus_message* call, void* /*userdata*/, sd_bus_error* /*error*/) {
    const char* name = nullptr;
    if (sd_bus_message_read(call, "s", &name) < 0) {
      return -EBADMSG;
    }
    std::clog << "OpenClient " << quoted(name) << std::endl;
    return sd_bus_reply_method_return(call, "");
  }

  static int getServerState(sd_bus* /*bus*/, const char* /*path*/, const char* /*interface*/,
                            const char* /*property*/, sd_bus_message* reply, void* userdata,
                            sd_bus_error* /*error*/) {
    const auto* const state =
        textIn(static_cast<Manager*>(static_cast<Service*>(userdata))->profile.serverState);
    if (state == nullptr) {
      return sd_bus_message_append(reply, "x", std::int64_t{1});
    }
    return appendText(reply, *state) ? 1 : -EINVAL;
  }

  bool takeControl() {
    struct stat input {};
    const bool isPipe = fstat(STDIN_FILENO, &input) == 0 && S_ISFIFO(input.st_mode);
    const bool listening = !isPipe || sd_event_add_io(loop.get(), nullptr, STDIN_FILENO, EPOLLIN,
                                                      controlReadable, this) >= 0;
    if (!listening) {
      complain("cannot listen to standard input");
    }
    return listening;
  }

  static int controlReadable(sd_event_source* source, int file, std::uint32_t /*events*/,
                             void* userdata) {
    auto& manager = *static_cast<Manager*>(userdata);
    std::array<char, 512> buffer{};
    const auto count = read(file, buffer.data(), buffer.size());
    if (count <= 0) {
      return sd_event_source_set_enabled(source, SD_EVENT_OFF);
    }
    for (const char character : std::string_view(buffer.data(), static_cast<std::size_t>(count))) {
      if (character == '\n') {
        manager.obey(std::exchange(manager.unfinishedLine, ""));
      } else {
        manager.unfinishedLine += character;
      }
    }
    return 0;
  }

  void obey(const std::string& line) {
    std::istringstream words(line);
    std::string word;
    std::string name = vell::kEventServerStateChange;
    std::string state;
    words >> word;
    const bool known =
        word == "state" ? bool(words >> state) : word == "event" && words >> name >> state;
    if (!known) {
      return complain(quoted(line) + " is neither state STATE nor event NAME STATE");
    }
    auto payload = profile.serverState;
    if (textIn(payload) != nullptr) {
      payload.set(vell::kKeyServerState, state);
    }
    if (word == "state") {
      profile.serverState = payload;
    }
    sendEvent(name, payload);
  }

  void sendEvent(const std::string& name, const MessageDict& payload) {
    sd_bus_message* newSignal = nullptr;
    const int created =
        sd_bus_message_new_signal(bus.get(), &newSignal, kManager.path, kManager.name, "Event");
    const BusMessagePtr message(newSignal);
    if (created < 0 || !appendText(newSignal, name) || !appendPayload(newSignal, payload) ||
        sd_bus_send(nullptr, newSignal, nullptr) < 0 || sd_bus_flush(bus.get()) < 0) {
      return complain("cannot send the event " + name);
    }
    std::clog << "Event " << name << " " << describe(payload) << std::endl;
  }

  std::string unfinishedLine;
};

}  // namespace

int serveManager(const Profile& profile, const std::filesystem::path& root) {
  Manager manager(kManager, profile, root);
  return manager.connect() ? manager.run() : EXIT_FAILURE;
}

int serveHelper(const Profile& profile, const std::filesystem::path& root) {
  static const sd_bus_vtable kTable[] = {
      SD_BUS_VTABLE_START(0),
      SD_BUS_METHOD_WITH_ARGS("Perform", SD_BUS_ARGS("u", task, "s", command, "a{sv}", request),
                              SD_BUS_RESULT("i", status, "v", reply), Service::callArrived, 0),
      SD_BUS_VTABLE_END,
  };
  Service helper(kHelper, profile, root);
  return helper.connect(kTable) ? helper.run() : EXIT_FAILURE;
}

}  // namespace simulator
