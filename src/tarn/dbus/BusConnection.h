#pragma once

#include <sdbus-c++/IConnection.h>
#include <sdbus-c++/IProxy.h>

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>

#include "tarn/client/LinkStatus.h"
#include "tarn/client/Transport.h"
#include "tarn/dbus/Loop.h"

namespace tarn::dbus {

// What a command answers while the service cannot be reached, and why.
CommandResult serviceGone(const std::string& reason);

// What a session is to be like: the configuration last pushed for each app ID, and whether its
// events are on. A session opened again, with a returning service or over a new connection to the
// bus, is made like this.
struct SessionWishes {
  std::map<std::int64_t, ipc::Object> configurations;
  bool eventsOn = false;

  // Keeps what `command` asked for when it took, or when the service was away: a configuration
  // pushed while the service is away is pushed when it comes.
  void remember(std::string_view command, const ipc::Object& input, const CommandResult& result);
};

// A session with the baseband manager service over one connection to a bus, which has a thread
// of its own. While the service is away, commands answer kServiceUnavailable and no events
// arrive; once it is back on the bus the session is opened again as `wishes` say.
class BusConnection final : public client::Connection {
 public:
  // `link` hears how the session stands. `busLost` runs on the connection's thread, once, when
  // the connection to the bus breaks; from then on the session only answers
  // kServiceUnavailable. Throws sdbus::Error when the bus refuses what the session needs.
  BusConnection(std::unique_ptr<sdbus::IConnection> bus, std::string clientName,
                client::EventSink sink, SessionWishes wishes,
                std::shared_ptr<client::LinkStatus> link, std::function<void()> busLost);
  ~BusConnection() override;
  BusConnection(const BusConnection&) = delete;
  BusConnection& operator=(const BusConnection&) = delete;

  CommandResult perform(std::string_view command, const ipc::Object& input,
                        ipc::Object& output) override;
  void setEventsOn(bool on) override;
  // What the session is to be like by now.
  SessionWishes wishes();

 private:
  void release();
  // The members below run on the loop thread.
  void subscribeAndOpen();
  bool openSession();
  void sessionLost(const std::string& reason);
  CommandResult performOnLoop(std::string_view command, const ipc::Object& input);
  CommandResult callPerformCommand(std::string_view command, const ipc::Object& input);
  void noteFailedCall(const sdbus::Error& error);
  void callSetEventsOn();
  void receiveEvents(sdbus::Message& signal);
  void serviceOwnerChanged(sdbus::Message& signal);

  const std::string clientName_;
  const client::EventSink sink_;
  const std::shared_ptr<client::LinkStatus> link_;
  const std::function<void()> busLost_;

  std::unique_ptr<sdbus::IProxy> manager_;
  // Empty while there is no session with the service.
  std::unique_ptr<sdbus::IProxy> session_;
  // The unique bus name of the service that opened the session.
  std::string serviceOwner_;
  std::string whyNoSession_;
  sdbus::Slot ownerChanges_;
  sdbus::Slot events_;
  SessionWishes wishes_;
  // Last, so that its thread starts once every member it may touch is there.
  Loop loop_;
};

}  // namespace tarn::dbus
