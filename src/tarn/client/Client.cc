#include "tarn/client/Client.h"

#include <mutex>

#include "platform/Log.h"
#include "tarn/client/Manager.h"
#include "tarn/client/Transport.h"

namespace tarn::client {

namespace {

struct TransportChoice {
  std::mutex mutex;
  std::shared_ptr<Transport> transport;

  static TransportChoice& instance() {
    static TransportChoice choice;
    return choice;
  }

  std::shared_ptr<Transport> current() {
    const std::lock_guard lock(mutex);
    return transport;
  }
};

// Answers whether there is a session; otherwise says so in the system log.
bool hasSession(const std::shared_ptr<Manager>& manager, const char* operation) {
  if (manager) return true;
  platform::log::systemf("tarn::client::%s: no session (the manager handle is empty)", operation);
  return false;
}

}  // namespace

void useTransport(std::shared_ptr<Transport> transport) {
  TransportChoice& choice = TransportChoice::instance();
  const std::lock_guard lock(choice.mutex);
  choice.transport = std::move(transport);
}

// The client library's calls keep the signatures their callers were written against: handles and
// texts by value.
// NOLINTBEGIN(performance-unnecessary-value-param)
std::shared_ptr<Manager> CreateManager(std::string clientName, platform::SerialQueue queue,
                                       Transport& transport) {
  return Manager::open(clientName, queue, transport);
}

std::shared_ptr<Manager> CreateManager(std::string clientName, platform::SerialQueue queue) {
  const std::shared_ptr<Transport> transport = TransportChoice::instance().current();
  if (!transport) {
    platform::log::systemf("tarn::client::CreateManager: no transport chosen; no session for %s",
                           clientName.c_str());
    return nullptr;
  }
  return Manager::open(clientName, queue, *transport);
}

CommandResult PerformCommand(std::shared_ptr<Manager> manager, std::string command,
                             const ipc::Object& input, ipc::Object& output) {
  if (!manager) {
    return {status::kNoSession, "no session: the manager handle is empty"};
  }
  return manager->perform(command, input, output);
}

void RegisterEventHandler(std::shared_ptr<Manager> manager, std::string event,
                          EventHandler handler) {
  if (hasSession(manager, "RegisterEventHandler")) {
    manager->registerEventHandler(std::move(event), std::move(handler));
  }
}

void EventsOff(std::shared_ptr<Manager> manager) {
  if (hasSession(manager, "EventsOff")) manager->setEventsOn(false);
}

void EventsOn(std::shared_ptr<Manager> manager) {
  if (hasSession(manager, "EventsOn")) manager->setEventsOn(true);
}
// NOLINTEND(performance-unnecessary-value-param)

}  // namespace tarn::client
