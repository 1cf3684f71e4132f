#pragma once

#include <sdbus-c++/IConnection.h>
#include <sdbus-c++/IObject.h>

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "tarn/dbus/Loop.h"
#include "tarn/dbus/Marshal.h"
#include "tarn/flow/DropTally.h"
#include "tarn/flow/KindQueue.h"
#include "tarn/service/Core.h"

namespace tarn::dbus {

// The baseband manager service on a bus, as org.norvo.Tarn1.xml describes it: the manager object,
// one object per session, and each session's events sent to its owner alone. A client that
// leaves the bus loses its sessions and, with them, its configurations.
class Service {
 public:
  // Serves `core` on `connection` and takes the bus name. Throws sdbus::Error when the name is
  // taken. `onBusLost` runs once if the connection to the bus breaks.
  Service(std::shared_ptr<service::Core> core, std::unique_ptr<sdbus::IConnection> connection,
          std::function<void(const std::string& reason)> onBusLost = {});
  ~Service();
  Service(const Service&) = delete;
  Service& operator=(const Service&) = delete;

 private:
  struct Session;
  struct Outgoing {
    service::Core::SessionId session;
    Event event;
  };

  void publish();
  void release();
  void openSession(sdbus::MethodCall& call);
  void performCommand(service::Core::SessionId id, sdbus::MethodCall& call);
  void setEventsOn(service::Core::SessionId id, sdbus::MethodCall& call);
  void closeSession(service::Core::SessionId id, sdbus::MethodCall& call);
  // Answers the session that `call` may use, after replying with an error when there is none.
  Session* sessionFor(service::Core::SessionId id, sdbus::MethodCall& call);
  void forgetPeer(const std::string& peer);

  // Any thread: queues an event for the loop to send. Answers false when the bus falls behind.
  bool queue(service::Core::SessionId session, std::string_view event, ipc::Object record);
  void sendQueued();

  const std::shared_ptr<service::Core> core_;
  Loop loop_;
  std::unique_ptr<sdbus::IObject> manager_;
  sdbus::Slot peersLeaving_;
  std::map<service::Core::SessionId, std::unique_ptr<Session>> sessions_;

  std::mutex outgoingMutex_;
  flow::KindQueue<Outgoing> outgoing_;
  flow::DropTally drops_{"tarnd"};
  bool sendQueued_ = false;
};

}  // namespace tarn::dbus
