#include "simulator/manager_service.h"

#include "platform/bus/bus_dictionary.h"
#include "platform/manager_names.h"
#include "simulator/complaint.h"
#include "simulator/request_text.h"

#include <sys/epoll.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <sstream>
#include <utility>

namespace simulator {

namespace {

constexpr Service::Identity kManagerIdentity = {"org.vell.Manager1", "/org/vell/Manager1",
                                                "org.vell.Manager1", "PerformCommand", true};

}  // namespace

ManagerService::ManagerService(Profile describedDevice, std::filesystem::path deviceRoot,
                               const RequestLog& log)
    : profile(std::move(describedDevice)), service(kManagerIdentity, std::move(deviceRoot), log) {}

bool ManagerService::connect() {
  // A state that is to be no string is an integer on the bus, and says so when it is asked.
  const bool isString = textIn(profile.serverState) != nullptr;
  static const sd_bus_vtable kStart[] = {SD_BUS_VTABLE_START(0)};
  static std::array<sd_bus_vtable, 6> vtable = {{
      kStart[0],
      SD_BUS_METHOD_WITH_ARGS("OpenClient", SD_BUS_ARGS("s", clientName), SD_BUS_NO_RESULT,
                              openClient, 0),
      SD_BUS_METHOD_WITH_ARGS("PerformCommand", SD_BUS_ARGS("s", command, "a{sv}", request),
                              SD_BUS_RESULT("i", status, "s", message, "v", reply), performCommand,
                              0),
      SD_BUS_SIGNAL_WITH_ARGS("Event", SD_BUS_ARGS("s", name, "v", payload), 0),
      SD_BUS_PROPERTY("ServerState", isString ? "s" : "x", getServerState, 0, 0),
      SD_BUS_VTABLE_END,
  }};
  return service.connect(vtable.data(), performCommand, this) && takeControl();
}

int ManagerService::openClient(sd_bus_message* call, void* userdata, sd_bus_error* /*error*/) {
  const auto& manager = *static_cast<ManagerService*>(userdata);
  const char* name = nullptr;
  const int result = sd_bus_message_read(call, "s", &name);
  if (result < 0) {
    return result;
  }
  manager.service.requestLog().write("OpenClient " + quoted(name));
  return sd_bus_reply_method_return(call, "");
}

int ManagerService::performCommand(sd_bus_message* call, void* userdata, sd_bus_error* /*error*/) {
  auto& manager = *static_cast<ManagerService*>(userdata);
  const char* command = nullptr;
  MessageDict request;
  if (sd_bus_message_read(call, "s", &command) < 0 || !readDictionary(call, request)) {
    return -EBADMSG;
  }
  const auto line = std::string("PerformCommand ") + command + " " + describe(request);
  manager.service.requestLog().write(line);
  return manager.service.give(call, answerOfManager(manager.profile, command, request), line);
}

int ManagerService::getServerState(sd_bus* /*bus*/, const char* /*path*/, const char* /*interface*/,
                                   const char* /*property*/, sd_bus_message* reply, void* userdata,
                                   sd_bus_error* /*error*/) {
  const auto& manager = *static_cast<ManagerService*>(userdata);
  // The signature was settled at the start, and the type of the state does not change.
  const auto* const state = textIn(manager.profile.serverState);
  return state != nullptr ? sd_bus_message_append(reply, "s", state->c_str())
                          : sd_bus_message_append(reply, "x", std::int64_t{1});
}

bool ManagerService::takeControl() {
  struct stat input {};
  if (fstat(STDIN_FILENO, &input) != 0 || !S_ISFIFO(input.st_mode)) {
    return true;
  }
  sd_event_source* source = nullptr;
  const int result =
      sd_event_add_io(service.eventLoop(), &source, STDIN_FILENO, EPOLLIN, controlReadable, this);
  control.reset(source);
  if (result < 0) {
    complain("cannot listen to standard input");
  }
  return result >= 0;
}

int ManagerService::controlReadable(sd_event_source* source, int file, std::uint32_t /*events*/,
                                    void* userdata) {
  auto& manager = *static_cast<ManagerService*>(userdata);
  std::array<char, 512> buffer{};
  const auto count = read(file, buffer.data(), buffer.size());
  if (count <= 0) {
    return sd_event_source_set_enabled(source, SD_EVENT_OFF);
  }
  auto& text = manager.unfinishedLine;
  text.append(buffer.data(), static_cast<std::size_t>(count));
  for (auto end = text.find('\n'); end != std::string::npos; end = text.find('\n')) {
    const auto line = text.substr(0, end);
    text.erase(0, end + 1);
    manager.obey(line);
  }
  return 0;
}

void ManagerService::obey(const std::string& line) {
  std::istringstream words(line);
  std::string word;
  std::string name = vell::kEventServerStateChange;
  std::string state;
  words >> word;
  const bool known =
      word == "state" ? bool(words >> state) : word == "event" && words >> name >> state;
  if (!known) {
    return complain("\"" + line + "\" is neither state STATE nor event NAME STATE");
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

void ManagerService::sendEvent(const std::string& name, const MessageDict& payload) {
  sd_bus_message* newSignal = nullptr;
  const int created = sd_bus_message_new_signal(
      service.connection(), &newSignal, kManagerIdentity.path, kManagerIdentity.interface, "Event");
  const BusMessagePtr message(newSignal);
  if (created < 0 || !appendText(newSignal, name) || !appendPayload(newSignal, payload) ||
      sd_bus_send(nullptr, newSignal, nullptr) < 0 || sd_bus_flush(service.connection()) < 0) {
    return complain("cannot send the event " + name);
  }
  service.requestLog().write("Event " + name + " " + describe(payload));
}

}  // namespace simulator
