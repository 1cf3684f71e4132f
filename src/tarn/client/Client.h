#pragma once

#include <functional>
#include <memory>
#include <string>

#include "platform/SerialQueue.h"
#include "tarn/CommandResult.h"
#include "tarn/Ipc.h"

// The client library of the baseband manager service: a session, commands, and the events that
// the service delivers.
namespace tarn::client {

using CommandResult = tarn::CommandResult;

// One session with the service.
class Manager;

// Handed to an event handler with each event, for handlers that finish an event's work
// elsewhere. The transports so far need no acknowledgement, so it carries nothing.
class CompletionGroup {};

using EventHandler = std::function<void(const ipc::Object& event, CompletionGroup group)>;

class Transport;

// Opens a session under `clientName` over `transport`. The session's events are delivered on
// `queue`. Empty when the service cannot be reached.
std::shared_ptr<Manager> CreateManager(std::string clientName, platform::SerialQueue queue,
                                       Transport& transport);

// The same over the transport the application chose (useTransport); empty, with a log line,
// while it has chosen none.
std::shared_ptr<Manager> CreateManager(std::string clientName, platform::SerialQueue queue);

// Sends one command and waits for its result on the calling thread. An empty handle gives status
// kNoSession.
CommandResult PerformCommand(std::shared_ptr<Manager> manager, std::string command,
                             const ipc::Object& input, ipc::Object& output);

// Calls `handler` on the session's queue for each event named `event`, replacing the handler
// registered for that name before.
void RegisterEventHandler(std::shared_ptr<Manager> manager, std::string event,
                          EventHandler handler);

// Stop, and resume, the delivery of the session's events. A new session starts with events off.
void EventsOff(std::shared_ptr<Manager> manager);
void EventsOn(std::shared_ptr<Manager> manager);

}  // namespace tarn::client
