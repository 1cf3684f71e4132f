#include "tarn/dbus/BusConnection.h"

#include <sdbus-c++/Error.h>
#include <sdbus-c++/IProxy.h>
#include <sdbus-c++/Types.h>

#include <set>

#include "platform/Format.h"
#include "platform/Log.h"
#include "tarn/Names.h"
#include "tarn/dbus/Interface.h"
#include "tarn/dbus/Marshal.h"

namespace tarn::dbus {

namespace {

constexpr std::uint64_t kCallTimeoutMicroseconds = 5'000'000;

const std::string kService(kBusName);

constexpr std::string_view kConnected = "connected to the baseband manager service";

}  // namespace

CommandResult serviceGone(const std::string& reason) {
  return {status::kServiceUnavailable, "the baseband manager service has gone away: " + reason};
}

void SessionWishes::remember(std::string_view command, const ipc::Object& input,
                             const CommandResult& result) {
  if (result.status != status::kSuccess && result.status != status::kServiceUnavailable) return;
  const ipc::Object* appId = input.find(kKeyAppID);
  if (appId == nullptr || appId->asInteger() == nullptr) return;
  if (command == kCommandAddConfiguration) {
    configurations.insert_or_assign(*appId->asInteger(), input);
  } else if (command == kCommandClearConfiguration) {
    configurations.erase(*appId->asInteger());
  }
}

BusConnection::BusConnection(std::unique_ptr<sdbus::IConnection> bus, std::string clientName,
                             client::EventSink sink, SessionWishes wishes,
                             std::shared_ptr<client::LinkStatus> link,
                             std::function<void()> busLost)
    : clientName_(std::move(clientName)),
      sink_(std::move(sink)),
      link_(std::move(link)),
      busLost_(std::move(busLost)),
      wishes_(std::move(wishes)),
      loop_(std::move(bus), [this](const std::string& reason) {
        sessionLost("the bus connection broke: " + reason);
        busLost_();
      }) {
  try {
    loop_.call([this] { subscribeAndOpen(); });
  } catch (...) {
    release();
    throw;
  }
}

void BusConnection::subscribeAndOpen() {
  sdbus::IConnection& connection = loop_.connection();
  manager_ = sdbus::createProxy(connection, kService, std::string(kManagerPath));
  ownerChanges_ = connection.addMatch(
      platform::format("type='signal',sender='org.freedesktop.DBus',"
                       "interface='org.freedesktop.DBus',member='NameOwnerChanged',arg0='%s'",
                       kBusName),
      [this](sdbus::Message& signal) { serviceOwnerChanged(signal); });
  events_ = connection.addMatch(platform::format("type='signal',interface='%s',member='%s'",
                                                 kSessionInterface, kEventsSignal),
                                [this](sdbus::Message& signal) { receiveEvents(signal); });
  if (openSession()) {
    link_->set(true, std::string(kConnected));
    platform::log::plainf("tarn::client: %s", kConnected);
  } else {
    link_->set(false, "waiting for the baseband manager service to come on the bus");
    platform::log::warningf(
        "tarn::client: the baseband manager service %s is not on the bus (%s); the session "
        "opens when it comes",
        kBusName, whyNoSession_);
  }
}

BusConnection::~BusConnection() {
  loop_.call([this] {
    if (!session_) return;
    try {
      sdbus::MethodCall close =
          session_->createMethodCall(kSessionInterfaceName, std::string(kClose));
      close.dontExpectReply();
      session_->callMethod(close);
    } catch (const sdbus::Error&) {
      // The service has gone, and the session with it.
    }
  });
  release();
}

void BusConnection::release() {
  loop_.stop();
  // The loop has ended, so what it used may go on this thread, before the connection.
  events_.reset();
  ownerChanges_.reset();
  session_.reset();
  manager_.reset();
}

CommandResult BusConnection::perform(std::string_view command, const ipc::Object& input,
                                     ipc::Object& /*output*/) {
  return loop_.call([&] { return performOnLoop(command, input); });
}

void BusConnection::setEventsOn(bool on) {
  loop_.call([this, on] {
    wishes_.eventsOn = on;
    if (session_) callSetEventsOn();
  });
}

SessionWishes BusConnection::wishes() {
  return loop_.call([this] { return wishes_; });
}

bool BusConnection::openSession() {
  try {
    sdbus::MethodCall open =
        manager_->createMethodCall(kManagerInterfaceName, std::string(kOpenSession));
    open << clientName_;
    sdbus::MethodReply reply = manager_->callMethod(open, kCallTimeoutMicroseconds);
    sdbus::ObjectPath path;
    reply >> path;
    serviceOwner_ = reply.getSender();
    session_ = sdbus::createProxy(loop_.connection(), kService, path);
  } catch (const sdbus::Error& error) {
    whyNoSession_ = error.getMessage();
    return false;
  }
  for (const auto& [appId, input] : wishes_.configurations) {
    const CommandResult result = callPerformCommand(kCommandAddConfiguration, input);
    if (result.status != status::kSuccess) {
      platform::log::systemf(
          "tarn::client: the configuration of app %lld was refused again: error=%d msg=%s", appId,
          result.status, result.message);
    }
  }
  if (wishes_.eventsOn && session_) callSetEventsOn();
  return session_ != nullptr;
}

void BusConnection::sessionLost(const std::string& reason) {
  if (!session_) return;
  session_.reset();
  serviceOwner_.clear();
  whyNoSession_ = reason;
  link_->set(false, "lost the baseband manager service (" + reason + "); waiting for it");
  platform::log::warningf("tarn::client: lost the session with the baseband manager service (%s)",
                          reason);
}

void BusConnection::serviceOwnerChanged(sdbus::Message& signal) {
  std::string name, oldOwner, newOwner;
  try {
    signal >> name >> oldOwner >> newOwner;
  } catch (const sdbus::Error&) {
    return;  // not what the bus sends
  }
  if (!oldOwner.empty() && oldOwner == serviceOwner_) sessionLost("it left the bus");
  if (newOwner.empty() || session_) return;
  if (openSession()) {
    link_->set(true, std::string(kConnected));
    platform::log::warningf(
        "tarn::client: the baseband manager service is back; session opened again with %zu "
        "configuration(s)",
        wishes_.configurations.size());
  }
}

CommandResult BusConnection::performOnLoop(std::string_view command, const ipc::Object& input) {
  CommandResult result =
      session_ || openSession() ? callPerformCommand(command, input) : serviceGone(whyNoSession_);
  wishes_.remember(command, input, result);
  return result;
}

CommandResult BusConnection::callPerformCommand(std::string_view command,
                                                const ipc::Object& input) {
  // a{sv} cannot say that the arguments were no dictionary at all.
  if (!input.isDictionary()) {
    return {status::kInvalidArgument, "the command's arguments are not a dictionary"};
  }
  try {
    sdbus::MethodCall call =
        session_->createMethodCall(kSessionInterfaceName, std::string(kPerformCommand));
    call << std::string(command);
    appendRecord(call, input);
    sdbus::MethodReply reply = session_->callMethod(call, kCallTimeoutMicroseconds);
    CommandResult result;
    reply >> result.status >> result.message;
    return result;
  } catch (const MalformedRecord& error) {
    return {status::kInvalidArgument,
            platform::format("the arguments cannot travel on D-Bus: %s", error.what())};
  } catch (const sdbus::Error& error) {
    noteFailedCall(error);
    return serviceGone(error.getMessage());
  }
}

void BusConnection::noteFailedCall(const sdbus::Error& error) {
  // A service that is slow to answer keeps the session; one that has left or forgotten it does
  // not.
  static const std::set<std::string, std::less<>> kSessionGone = {
      "org.freedesktop.DBus.Error.ServiceUnknown", "org.freedesktop.DBus.Error.NameHasNoOwner",
      "org.freedesktop.DBus.Error.UnknownObject", "org.freedesktop.DBus.Error.Disconnected"};
  if (kSessionGone.contains(error.getName())) sessionLost(error.getMessage());
}

void BusConnection::callSetEventsOn() {
  try {
    sdbus::MethodCall call =
        session_->createMethodCall(kSessionInterfaceName, std::string(kSetEventsOn));
    call << wishes_.eventsOn;
    session_->callMethod(call, kCallTimeoutMicroseconds);
  } catch (const sdbus::Error& error) {
    noteFailedCall(error);
  }
}

void BusConnection::receiveEvents(sdbus::Message& signal) {
  if (!session_ || signal.getPath() != session_->getObjectPath() ||
      signal.getSender() != serviceOwner_) {
    return;
  }
  try {
    for (Event& event : readEvents(signal))
      sink_(event.name, std::move(event.record));
  } catch (const MalformedRecord& error) {
    platform::log::systemf("tarn::client: events that do not read dropped: %s", error.what());
  }
}

}  // namespace tarn::dbus
