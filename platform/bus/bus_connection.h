#pragma once

#include "platform/bus/bus_handles.h"
#include "platform/posix/wake_up.h"

#include <systemd/sd-bus.h>

#include <chrono>
#include <cstdint>
#include <functional>
#include <list>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

/// The bus daemon's own name on the bus. Nobody else can send under it.
inline constexpr const char* kBusDaemon = "org.freedesktop.DBus";

/// Whether `sender`, a unique name or `kBusDaemon`, sent `message`. The bus daemon sets the sender
/// of every message. A signal's sender must be checked even when a match rule names it: anyone may
/// address a signal straight to us, and sd_bus_add_match(3) does not compare well-known names.
bool isFrom(sd_bus_message* message, std::string_view sender);

/// One call of a method on the bus. The texts are the caller's and outlive the connection.
struct BusCall {
  const char* destination = nullptr;
  const char* path = nullptr;
  const char* interface = nullptr;
  const char* member = nullptr;
  /// Appends the arguments; false when that fails. Runs on the connection's thread.
  std::function<bool(sd_bus_message*)> fill;
};

/// How a call ended.
enum class BusOutcome {
  answered,  ///< With a reply that is not an error.
  noOwner,   ///< The bus says that nobody owns the destination, or there was no bus to ask.
  failed,    ///< In any other way.
};

/// A connection to the system bus, kept up by a thread of its own, which alone touches it.
///
/// Connects at once to the bus that sd_bus_open_system(3) finds. After a failure or a loss it tries
/// again at each call and a few times a second. A bus that is slow to greet is waited for once;
/// after that it counts as no bus until it greets.
class BusConnection {
 public:
  /// Receives the end of one call, on the connection's thread. `reply` is null unless the outcome
  /// is `answered`, and valid only during the call.
  using ReplyHandler = std::function<void(BusOutcome outcome, sd_bus_message* reply)>;

  /// What happens to the connection as a whole, told on its thread.
  struct Hooks {
    std::function<void(sd_bus* bus)> connected;  ///< A new connection is ready, before any call.
    std::function<void()> lost;                  ///< It is gone; slots on it are to be released.
  };

  /// Starts to connect. `threadName` is for people; either hook may be empty.
  BusConnection(const std::string& threadName, Hooks hooks);
  BusConnection(const BusConnection&) = delete;
  BusConnection& operator=(const BusConnection&) = delete;

  /// Ends the thread, with every outstanding call answered `failed`. Not on the thread itself.
  ~BusConnection();

  /// Sends a call that starts no service and has no time limit. `handler` is called exactly once,
  /// whatever happens, and then released. From any thread.
  void call(BusCall call, ReplyHandler handler);

  /// Runs `task` on the connection's thread, after the calls and tasks handed in before; when
  /// called there, at once. From any thread.
  void post(std::function<void()> task);

 private:
  using Clock = std::chrono::steady_clock;

  /// A call to be sent once the bus has greeted.
  struct Waiting {
    BusCall call;
    ReplyHandler handler;
  };

  /// A call that was sent and not answered yet.
  struct Pending {
    BusConnection* connection;
    ReplyHandler handler;
    BusSlotPtr slot;
  };

  static int onReply(sd_bus_message* reply, void* userdata, sd_bus_error* error);

  void run();
  bool runPosted();
  void connect();
  void process();
  void drop();
  void becomeReady();
  void startCall(BusCall call, ReplyHandler handler);
  void send(const BusCall& call, ReplyHandler handler);
  [[nodiscard]] bool sendTo(sd_bus* target, const BusCall& call, Pending& pending);
  void finish(std::list<Pending>::iterator pending, sd_bus_message* reply);
  [[nodiscard]] Clock::time_point wakeTime() const;
  void wait();

  const Hooks hooks;
  WakeUp wakeUp;

  // Of the connection's thread alone.
  BusPtr bus;
  bool ready = false;       // the bus has greeted
  bool distrusted = false;  // the last connection was never greeted
  Clock::time_point greetingLimit;
  Clock::time_point nextAttempt;
  std::vector<Waiting> waitingCalls;
  std::list<Pending> pendingCalls;

  std::mutex mutex;
  std::vector<std::function<void()>> posted;  ///< Guarded by `mutex`.
  bool stopping = false;                      ///< Guarded by `mutex`.

  std::thread thread;
};
