#include "simulator/service.h"

#include "platform/bus/bus_dictionary.h"
#include "simulator/collection_writer.h"
#include "simulator/complaint.h"

#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <ctime>
#include <utility>

namespace simulator {

namespace {

constexpr std::int32_t kStatusNotCollected = static_cast<std::int32_t>(0xE020E004U);

}  // namespace

Service::Service(const Identity& ownIdentity, std::filesystem::path deviceRoot,
                 const RequestLog& log)
    : identity(ownIdentity), root(std::move(deviceRoot)), requests(log) {}

bool Service::connect(const sd_bus_vtable* vtable, sd_bus_message_handler_t handler,
                      void* userdata) {
  requestHandler = handler;
  handlersData = userdata;
  sd_event* newLoop = nullptr;
  sd_bus* newBus = nullptr;
  sd_bus_slot* newTable = nullptr;
  sd_bus_slot* newAhead = nullptr;
  int result = sd_event_new(&newLoop);
  loop.reset(newLoop);
  if (result >= 0) {
    result = sd_bus_open_system(&newBus);
    bus.reset(newBus);
  }
  if (result >= 0) {
    result = sd_bus_attach_event(newBus, newLoop, SD_EVENT_PRIORITY_NORMAL);
  }
  if (result >= 0) {
    result = sd_bus_add_object_vtable(newBus, &newTable, identity.path, identity.interface, vtable,
                                      userdata);
    table.reset(newTable);
  }
  if (result >= 0) {
    result = sd_bus_add_object(newBus, &newAhead, identity.path, requestArrived, this);
    ahead.reset(newAhead);
  }
  if (result >= 0) {
    result = sd_bus_set_exit_on_disconnect(newBus, 1);
  }
  if (result >= 0) {
    result = sd_bus_request_name(newBus, identity.name, 0);
  }
  if (result < 0) {
    complain(std::string("cannot serve ") + identity.name + ": " + std::strerror(-result));
  }
  return result >= 0;
}

/// Comes before the table, whose methods cannot reply with another signature than their own.
int Service::requestArrived(sd_bus_message* call, void* userdata, sd_bus_error* error) {
  const auto& service = *static_cast<Service*>(userdata);
  const auto& own = service.identity;
  return sd_bus_message_is_method_call(call, own.interface, own.method) > 0
             ? service.requestHandler(call, service.handlersData, error)
             : 0;
}

int Service::give(sd_bus_message* call, Answer answer, const std::string& about) {
  if (answer.delay.count() == 0) {
    return carryOut(call, std::move(answer), about);
  }
  held.push_back(
      {this, BusMessagePtr(sd_bus_message_ref(call)), std::move(answer), about, nullptr});
  auto& pending = held.back();
  const auto delay = std::chrono::duration_cast<std::chrono::microseconds>(pending.answer.delay);
  sd_event_source* timer = nullptr;
  const int result = sd_event_add_time_relative(loop.get(), &timer, CLOCK_MONOTONIC,
                                                static_cast<std::uint64_t>(delay.count()), 1,
                                                timerFired, &pending);
  pending.timer.reset(timer);
  return result < 0 ? result : 1;
}

int Service::timerFired(sd_event_source* /*source*/, std::uint64_t /*time*/, void* userdata) {
  auto& pending = *static_cast<Pending*>(userdata);
  auto& service = *pending.service;
  service.carryOut(pending.call.get(), std::move(pending.answer), pending.about);
  service.held.remove_if([&](const Pending& other) { return &other == &pending; });
  return 0;
}

int Service::carryOut(sd_bus_message* call, Answer answer, const std::string& about) {
  if (answer.collection && !writeCollection(root, *answer.collection, about)) {
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

int Service::reply(sd_bus_message* call, const Answer& answer) const {
  sd_bus_message* newReply = nullptr;
  const int created = sd_bus_message_new_method_return(call, &newReply);
  const BusMessagePtr message(newReply);
  if (created < 0) {
    return created;
  }
  const bool appended = sd_bus_message_append(newReply, "i", answer.status) >= 0 &&
                        (!identity.repliesWithMessage || appendText(newReply, answer.message)) &&
                        appendPayload(newReply, answer.reply);
  return appended ? sd_bus_send(nullptr, newReply, nullptr) : -ENOMEM;
}

int Service::run() {
  const int result = sd_event_loop(loop.get());
  if (result < 0) {
    complain(std::string(identity.name) + ": " + std::strerror(-result));
  }
  return result == 0 ? 0 : 1;
}

}  // namespace simulator
