#pragma once

#include "platform/command_result.h"
#include "platform/message_dict.h"
#include "platform/work_group.h"
#include "platform/work_queue.h"

#include <functional>
#include <memory>
#include <string>

/// The client of the manager daemon: its commands and its events.
///
/// Every operation may be called from any thread. None of them throws, and none reports a failure
/// by itself: what can go wrong with a command is in its result.
namespace vell::client {

/// A connection to the manager. Opaque: it is used through the functions below, which all take a
/// handle that is not empty. Requests still outstanding when the last handle goes are answered with
/// a failure.
class Manager;

/// Called on the work queue for each event. An event counts only when the connection that owns the
/// manager's name sent it. `payload` is what came with the event; `group` is a group of the
/// library's own that the handler may enter for work that it starts.
using EventHandler = std::function<void(MessageDict payload, WorkGroup group)>;

/// Called once for each asynchronous command, on the work queue, and destroyed right after.
using Completion = std::function<void(CommandResult result, MessageDict reply)>;

/// Opens a client that makes itself known to the manager as `clientName` and runs its handlers and
/// completions on `queue`. Always gives a client: with nothing to connect to it is a client of a
/// manager that does not run, and it connects as soon as it can.
std::shared_ptr<Manager> CreateManager(const std::string& clientName, WorkQueue queue);

/// Registers `handler` for the events named `eventName`, in place of an earlier one. The library
/// keeps its copy for as long as the client lives. Nothing is delivered before `EventsOn`.
void RegisterEventHandler(std::shared_ptr<Manager> manager, const std::string& eventName,
                          EventHandler handler);

/// Starts the delivery of events with one server-state event for the manager's present state. The
/// state is "Stopped" while no manager runs; its coming and going are delivered as such events too.
void EventsOn(std::shared_ptr<Manager> manager);

/// Stops the delivery: no handler is called any more. One that runs on another thread at that
/// moment is waited for, so not to be called with a lock held that a handler takes.
void EventsOff(std::shared_ptr<Manager> manager);

/// Sends a command and returns at once. `completion` is called exactly once, whatever happens to
/// the manager or to the connection; there is no time limit. A command of which the bus says that
/// no manager runs has the status `kStatusManagerNotRunning`. Text that is not valid UTF-8 or that
/// holds a NUL is sent with U+FFFD in those places, because the bus carries nothing else.
void PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                    Completion completion, MessageDict request);

/// Sends a command and blocks until its answer is in; otherwise as the asynchronous form. Needs no
/// queue, so it may be called while the work queue is busy, and from the work queue. `reply`
/// receives the reply. After any status but 0 it is `MessageDict::notADictionary()`.
CommandResult PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                             MessageDict request, MessageDict* reply);

}  // namespace vell::client
