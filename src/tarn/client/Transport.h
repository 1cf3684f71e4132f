#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "tarn/CommandResult.h"
#include "tarn/Ipc.h"

// How sessions reach the baseband manager service. A transport opens connections; the client
// library's Manager talks to one connection and never to the service itself.
namespace tarn::client {

// Receives the events of one connection: the event's name and its object. The transport calls it
// from its own threads, one call at a time, in the order the service sent the events. It never
// blocks; it answers false when the session is falling behind, so that a transport that can
// hold its sender back does.
using EventSink = std::function<bool(std::string_view event, ipc::Object object)>;

// One open session with the service. Destroying it closes the session: no sink call runs after
// the destructor has returned.
class Connection {
 public:
  virtual ~Connection() = default;
  virtual CommandResult perform(std::string_view command, const ipc::Object& input,
                                ipc::Object& output) = 0;
  virtual void setEventsOn(bool on) = 0;
};

class Transport {
 public:
  virtual ~Transport() = default;
  // Empty when the service cannot be reached.
  virtual std::unique_ptr<Connection> connect(const std::string& clientName, EventSink sink) = 0;
};

// The application's choice of transport for the sessions created from now on without one;
// sessions already open keep theirs. The library knows no service of its own: until the
// application chooses, such sessions are not opened.
void useTransport(std::shared_ptr<Transport> transport);

}  // namespace tarn::client
