#include "tarn/dbus/Service.h"

#include <sdbus-c++/Error.h>
#include <sdbus-c++/Types.h>

#include "platform/Format.h"
#include "platform/Log.h"
#include "tarn/dbus/Interface.h"

namespace tarn::dbus {

namespace {

// Events waiting to be sent beyond kMaxQueuedEvents are dropped, the oldest of their kind first:
// a bus that stops taking them must not make the service grow without bound. Past
// kFallingBehind the source is held back.
constexpr std::size_t kMaxQueuedEvents = 100'000;
constexpr std::size_t kFallingBehind = 10'000;

std::string sessionPath(service::Core::SessionId id) {
  return platform::format("%s%llu", kSessionPathPrefix, id);
}

void replyStatus(sdbus::MethodCall& call, const CommandResult& result) {
  sdbus::MethodReply reply = call.createReply();
  reply << result.status << result.message;
  reply.send();
}

}  // namespace

struct Service::Session {
  std::string owner;  // the unique bus name of the client that opened it
  std::unique_ptr<sdbus::IObject> object;
};

Service::Service(std::shared_ptr<service::Core> core,
                 std::unique_ptr<sdbus::IConnection> connection,
                 std::function<void(const std::string&)> onBusLost)
    : core_(std::move(core)),
      loop_(std::move(connection), std::move(onBusLost)),
      outgoing_(kMaxQueuedEvents) {
  try {
    loop_.call([this] { publish(); });
  } catch (...) {
    release();
    throw;
  }
}

void Service::publish() {
  sdbus::IConnection& bus = loop_.connection();
  manager_ = sdbus::createObject(bus, std::string(kManagerPath));
  manager_->registerMethod(kManagerInterfaceName, std::string(kOpenSession), "s", {"client_name"},
                           "o", {"session"}, [this](sdbus::MethodCall call) { openSession(call); });
  sdbus::Flags constant;
  constant.set(sdbus::Flags::CONST_PROPERTY_VALUE);
  manager_->registerProperty(
      kManagerInterfaceName, std::string(kVersionProperty), "u",
      [](sdbus::PropertyGetReply& reply) { reply << kInterfaceVersion; }, constant);
  manager_->finishRegistration();
  peersLeaving_ = bus.addMatch(
      "type='signal',sender='org.freedesktop.DBus',interface='org.freedesktop.DBus',"
      "member='NameOwnerChanged'",
      [this](sdbus::Message& signal) {
        std::string name, oldOwner, newOwner;
        try {
          signal >> name >> oldOwner >> newOwner;
        } catch (const sdbus::Error&) {
          return;  // not what the bus sends
        }
        if (newOwner.empty() && name.starts_with(':')) forgetPeer(name);
      });
  bus.requestName(std::string(kBusName));
}

Service::~Service() {
  loop_.call([this] {
    for (const auto& [id, session] : sessions_)
      core_->closeSession(id);
  });
  release();
}

void Service::release() {
  loop_.stop();
  // The loop has ended, so the objects may go on this thread, before the connection.
  sessions_.clear();
  peersLeaving_.reset();
  manager_.reset();
}

void Service::openSession(sdbus::MethodCall& call) {
  std::string clientName;
  try {
    call >> clientName;
  } catch (const sdbus::Error& error) {
    throw sdbus::Error("org.freedesktop.DBus.Error.InvalidArgs",
                       "OpenSession takes the client name (s): " + error.getMessage());
  }
  const std::string owner = call.getSender();
  // The sink learns its session once there is one; before that its events are off, and turning
  // them on takes the core's lock, which hands the ID over.
  const auto sinkSession = std::make_shared<service::Core::SessionId>();
  const service::Core::SessionId id = core_->openSession(
      clientName,
      [this, sinkSession](std::string_view event, ipc::Object record) {
        return queue(*sinkSession, event, std::move(record));
      },
      owner);
  *sinkSession = id;
  auto session = std::make_unique<Session>();
  session->owner = owner;
  session->object = sdbus::createObject(loop_.connection(), sessionPath(id));
  sdbus::IObject& object = *session->object;
  object.registerMethod(kSessionInterfaceName, std::string(kPerformCommand), "sa{sv}",
                        {"command", "arguments"}, "is", {"status", "message"},
                        [this, id](sdbus::MethodCall method) { performCommand(id, method); });
  object.registerMethod(kSessionInterfaceName, std::string(kSetEventsOn), "b", {"on"}, "", {},
                        [this, id](sdbus::MethodCall method) { setEventsOn(id, method); });
  object.registerMethod(kSessionInterfaceName, std::string(kClose), "", {}, "", {},
                        [this, id](sdbus::MethodCall method) { closeSession(id, method); });
  object.registerSignal(kSessionInterfaceName, std::string(kEventsSignal),
                        std::string(kEventsSignature), {"events"});
  object.finishRegistration();
  sessions_.emplace(id, std::move(session));

  sdbus::MethodReply reply = call.createReply();
  reply << sdbus::ObjectPath(sessionPath(id));
  reply.send();
}

Service::Session* Service::sessionFor(service::Core::SessionId id, sdbus::MethodCall& call) {
  const auto found = sessions_.find(id);
  if (found == sessions_.end()) return nullptr;
  if (found->second->owner != call.getSender()) {
    throw sdbus::Error("org.freedesktop.DBus.Error.AccessDenied",
                       "the session belongs to another client");
  }
  return found->second.get();
}

void Service::performCommand(service::Core::SessionId id, sdbus::MethodCall& call) {
  if (sessionFor(id, call) == nullptr) {
    replyStatus(call, {status::kNoSession, "no session: it has been closed"});
    return;
  }
  std::string command;
  ipc::Object input;
  try {
    call >> command;
    input = readRecord(call);
  } catch (const sdbus::Error& error) {
    replyStatus(
        call, {status::kInvalidArgument,
               "PerformCommand takes a command and its arguments (sa{sv}): " + error.getMessage()});
    return;
  } catch (const MalformedRecord& error) {
    replyStatus(call, {status::kInvalidArgument, error.what()});
    return;
  }
  replyStatus(call, core_->perform(id, command, input));
}

void Service::setEventsOn(service::Core::SessionId id, sdbus::MethodCall& call) {
  bool on = false;
  try {
    call >> on;
  } catch (const sdbus::Error& error) {
    throw sdbus::Error("org.freedesktop.DBus.Error.InvalidArgs",
                       "SetEventsOn takes a boolean (b): " + error.getMessage());
  }
  if (sessionFor(id, call) != nullptr) core_->setEventsOn(id, on);
  call.createReply().send();
}

void Service::closeSession(service::Core::SessionId id, sdbus::MethodCall& call) {
  if (sessionFor(id, call) != nullptr) {
    core_->closeSession(id);
    // An object cannot go while it is answering a call: it goes after the reply.
    loop_.post([this, id] { sessions_.erase(id); });
  }
  call.createReply().send();
}

void Service::forgetPeer(const std::string& peer) {
  std::size_t closed = 0;
  for (auto session = sessions_.begin(); session != sessions_.end();) {
    if (session->second->owner != peer) {
      ++session;
      continue;
    }
    core_->closeSession(session->first);
    session = sessions_.erase(session);
    ++closed;
  }
  if (closed > 0) {
    platform::log::plainf("tarnd: client %s left the bus; closed its %zu session(s)", peer, closed);
  }
}

bool Service::queue(service::Core::SessionId session, std::string_view event, ipc::Object record) {
  bool keepingUp = true;
  {
    const std::lock_guard lock(outgoingMutex_);
    const std::uint64_t kind = flow::kindOfEvent(event, record);
    if (const auto dropped =
            outgoing_.push(kind, {session, {std::string(event), std::move(record)}})) {
      drops_.count(*dropped);
    }
    keepingUp = outgoing_.size() < kFallingBehind;
    if (sendQueued_) return keepingUp;
    sendQueued_ = true;
  }
  loop_.post([this] { sendQueued(); });
  return keepingUp;
}

void Service::sendQueued() {
  std::vector<Outgoing> batch;
  std::optional<std::string> dropReport;
  {
    const std::lock_guard lock(outgoingMutex_);
    batch = outgoing_.takeAll();
    sendQueued_ = false;
    dropReport = drops_.report(flow::DropTally::Clock::now());
  }
  if (dropReport) platform::log::warning(*dropReport);
  // One signal per session, with that session's events in their order.
  std::map<service::Core::SessionId, std::vector<Event>> bySession;
  for (Outgoing& outgoing : batch) {
    bySession[outgoing.session].push_back(std::move(outgoing.event));
  }
  for (auto& [id, events] : bySession) {
    const auto found = sessions_.find(id);
    if (found == sessions_.end()) continue;
    Session& session = *found->second;
    try {
      sdbus::Signal signal =
          session.object->createSignal(kSessionInterfaceName, std::string(kEventsSignal));
      signal.setDestination(session.owner);
      appendEvents(signal, events);
      session.object->emitSignal(signal);
    } catch (const std::exception& error) {
      platform::log::plainf("tarnd: %zu event(s) for %s not sent: %s", events.size(), session.owner,
                            error.what());
    }
  }
}

}  // namespace tarn::dbus
