#include "simulator/helper_service.h"

#include "platform/bus/bus_dictionary.h"
#include "simulator/request_text.h"

#include <cerrno>
#include <string>
#include <utility>

namespace simulator {

namespace {

constexpr Service::Identity kHelperIdentity = {"org.vell.Helper1", "/org/vell/Helper1",
                                               "org.vell.Helper1", "Perform", false};

}  // namespace

HelperService::HelperService(Profile describedDevice, std::filesystem::path deviceRoot,
                             const RequestLog& log)
    : profile(std::move(describedDevice)), service(kHelperIdentity, std::move(deviceRoot), log) {}

bool HelperService::connect() {
  static const sd_bus_vtable kVtable[] = {
      SD_BUS_VTABLE_START(0),
      SD_BUS_METHOD_WITH_ARGS("Perform", SD_BUS_ARGS("u", task, "s", command, "a{sv}", request),
                              SD_BUS_RESULT("i", status, "v", reply), perform, 0),
      SD_BUS_VTABLE_END,
  };
  return service.connect(kVtable, perform, this);
}

int HelperService::perform(sd_bus_message* call, void* userdata, sd_bus_error* /*error*/) {
  auto& helper = *static_cast<HelperService*>(userdata);
  std::uint32_t task = 0;
  const char* command = nullptr;
  MessageDict request;
  if (sd_bus_message_read(call, "us", &task, &command) < 0 || !readDictionary(call, request)) {
    return -EBADMSG;
  }
  const auto line = "Perform " + std::to_string(task) + " " + command + " " + describe(request);
  helper.service.requestLog().write(line);
  return helper.service.give(call, answerOfHelper(helper.profile, command, request), line);
}

}  // namespace simulator
