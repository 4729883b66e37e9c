#include "platform/bus/bus_connection.h"

#include "platform/process_end.h"
#include "platform/threads.h"

#include <poll.h>

#include <algorithm>
#include <cerrno>
#include <utility>

namespace {

using namespace std::chrono_literals;

/// Pause between two attempts to connect.
constexpr auto kRetryPause = 250ms;

/// Time that a bus has to greet a new connection. After that it counts as no bus.
constexpr auto kGreetingPatience = 5s;

/// Messages that are handled before new calls get their turn.
constexpr int kMostStepsAtOnce = 64;

/// No time limit, for sd_bus_call_async(3).
constexpr std::uint64_t kNoTimeLimit = UINT64_MAX;

/// Whoever owns the destination may answer with these errors too; that says nothing of an owner.
bool meansNoOwner(sd_bus_message* reply) {
  return isFrom(reply, kBusDaemon) &&
         (sd_bus_message_is_method_error(reply, SD_BUS_ERROR_SERVICE_UNKNOWN) > 0 ||
          sd_bus_message_is_method_error(reply, SD_BUS_ERROR_NAME_HAS_NO_OWNER) > 0);
}

}  // namespace

bool isFrom(sd_bus_message* message, std::string_view sender) {
  const char* actual = sd_bus_message_get_sender(message);
  return actual != nullptr && actual == sender;
}

BusConnection::BusConnection(const std::string& threadName, Hooks connectionHooks)
    : hooks(std::move(connectionHooks)) {
  // The thread takes the lock before anything else, and so finds `thread` set.
  const std::lock_guard lock(mutex);
  thread = startThread(threadName, [this] { run(); });
}

BusConnection::~BusConnection() {
  {
    const std::lock_guard lock(mutex);
    stopping = true;
  }
  wakeUp.signal();
  thread.join();
}

void BusConnection::call(BusCall call, ReplyHandler handler) {
  post([this, call = std::move(call), handler = std::move(handler)]() mutable {
    startCall(std::move(call), std::move(handler));
  });
}

void BusConnection::post(std::function<void()> task) {
  if (std::this_thread::get_id() == thread.get_id()) {
    task();
    return;
  }
  {
    const std::lock_guard lock(mutex);
    posted.push_back(std::move(task));
  }
  wakeUp.signal();
}

void BusConnection::run() {
  while (runPosted()) {
    if (!bus && Clock::now() >= nextAttempt) {
      connect();
    }
    process();
    wait();
  }
  drop();
}

/// Runs the posted tasks. Returns false once the thread is to end.
bool BusConnection::runPosted() {
  std::vector<std::function<void()>> tasks;
  bool ending = false;
  {
    const std::lock_guard lock(mutex);
    wakeUp.clear();
    tasks.swap(posted);
    ending = stopping;
  }
  for (auto& task : tasks) {
    task();
  }
  return !ending;
}

void BusConnection::connect() {
  sd_bus* opened = nullptr;
  nextAttempt = Clock::now() + kRetryPause;
  if (checked(sd_bus_open_system(&opened)) < 0) {
    return;
  }
  bus.reset(opened);
  ready = false;
  greetingLimit = Clock::now() + kGreetingPatience;
}

void BusConnection::process() {
  int progress = bus ? 1 : 0;
  for (int step = 0; progress > 0 && step < kMostStepsAtOnce; ++step) {
    progress = checked(sd_bus_process(bus.get(), nullptr));
    if (!ready && sd_bus_is_ready(bus.get()) > 0) {
      becomeReady();
    }
  }
  const bool greetingFailed = bus && !ready && Clock::now() >= greetingLimit;
  if (progress < 0 || greetingFailed || (bus && sd_bus_is_open(bus.get()) <= 0)) {
    drop();
  }
}

void BusConnection::becomeReady() {
  ready = true;
  if (hooks.connected) {
    hooks.connected(bus.get());
  }
  for (auto& waiting : std::exchange(waitingCalls, {})) {
    send(waiting.call, std::move(waiting.handler));
  }
}

/// Closes the connection and fails every call under way on it.
void BusConnection::drop() {
  if (!bus) {
    return;
  }
  if (ready && hooks.lost) {
    hooks.lost();
  }
  distrusted = !ready;
  ready = false;
  const auto unsent = std::exchange(waitingCalls, {});
  auto unanswered = std::exchange(pendingCalls, {});
  for (auto& pending : unanswered) {
    pending.slot.reset();
  }
  bus.reset();
  nextAttempt = Clock::now() + kRetryPause;
  for (const auto& waiting : unsent) {
    waiting.handler(BusOutcome::noOwner, nullptr);
  }
  for (const auto& pending : unanswered) {
    pending.handler(BusOutcome::failed, nullptr);
  }
}

/// Sends a call now, or once the bus has greeted. Without a bus, answers it at once.
void BusConnection::startCall(BusCall call, ReplyHandler handler) {
  if (!bus) {
    connect();
  }
  if (ready) {
    send(call, std::move(handler));
  } else if (bus && !distrusted) {
    waitingCalls.push_back({std::move(call), std::move(handler)});
  } else {
    handler(BusOutcome::noOwner, nullptr);
  }
}

void BusConnection::send(const BusCall& call, ReplyHandler handler) {
  auto& pending = pendingCalls.emplace_back(Pending{this, std::move(handler), nullptr});
  if (!sendTo(bus.get(), call, pending)) {
    const auto unsent = std::move(pending.handler);
    pendingCalls.pop_back();
    unsent(BusOutcome::failed, nullptr);
  }
}

bool BusConnection::sendTo(sd_bus* target, const BusCall& call, Pending& pending) {
  sd_bus_message* made = nullptr;
  if (checked(sd_bus_message_new_method_call(target, &made, call.destination, call.path,
                                             call.interface, call.member)) < 0) {
    return false;
  }
  const BusMessagePtr message(made);
  if (!call.fill(made) || sd_bus_message_set_auto_start(made, 0) < 0) {
    return false;
  }
  sd_bus_slot* slot = nullptr;
  if (checked(sd_bus_call_async(target, &slot, made, onReply, &pending, kNoTimeLimit)) < 0) {
    return false;
  }
  pending.slot.reset(slot);
  return true;
}

int BusConnection::onReply(sd_bus_message* reply, void* userdata, sd_bus_error* /*error*/) {
  auto& calls = static_cast<Pending*>(userdata)->connection->pendingCalls;
  const auto pending = std::find_if(
      calls.begin(), calls.end(), [&](const Pending& candidate) { return &candidate == userdata; });
  pending->connection->finish(pending, reply);
  return 1;
}

void BusConnection::finish(std::list<Pending>::iterator pending, sd_bus_message* reply) {
  const auto handler = std::move(pending->handler);
  pendingCalls.erase(pending);
  if (sd_bus_message_is_method_error(reply, nullptr) <= 0) {
    handler(BusOutcome::answered, reply);
  } else {
    handler(meansNoOwner(reply) ? BusOutcome::noOwner : BusOutcome::failed, nullptr);
  }
}

/// The time at which the thread must run even if no descriptor is ready.
BusConnection::Clock::time_point BusConnection::wakeTime() const {
  if (!bus) {
    return nextAttempt;
  }
  auto earliest = ready ? Clock::time_point::max() : greetingLimit;
  std::uint64_t busLimit = UINT64_MAX;
  if (sd_bus_get_timeout(bus.get(), &busLimit) >= 0 && busLimit != UINT64_MAX) {
    const std::chrono::microseconds sinceBoot(busLimit);
    earliest = std::min(earliest, Clock::time_point(sinceBoot));
  }
  return earliest;
}

void BusConnection::wait() {
  const int busEvents = bus ? std::max(sd_bus_get_events(bus.get()), 0) : 0;
  pollfd watched[] = {
      {wakeUp.descriptor(), POLLIN, 0},
      {bus ? sd_bus_get_fd(bus.get()) : -1, static_cast<short>(busEvents), 0},
  };
  const auto until = wakeTime();
  if (until == Clock::time_point::max()) {
    poll(watched, std::size(watched), -1);
    return;
  }
  const auto left = std::chrono::ceil<std::chrono::milliseconds>(until - Clock::now());
  poll(watched, std::size(watched),
       static_cast<int>(std::clamp<std::int64_t>(left.count(), 0, 60000)));
}
