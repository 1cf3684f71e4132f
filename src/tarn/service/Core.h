#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "tarn/CommandResult.h"
#include "tarn/Ipc.h"
#include "tarn/service/Apps.h"
#include "tarn/service/Configuration.h"
#include "tarn/service/MetricSource.h"

namespace tarn::service {

class Arguments;

// The baseband manager service without its transport: client sessions, the metric configuration
// of each app, the commands, and the fan-out of metrics and trigger events to the sessions.
//
// Sessions belong to a peer: the process at the other end of a transport. Each peer configures
// its apps for itself, so two clients of one app may ask for different metrics; a peer's
// configurations go with its last session.
//
// Every member may be called from any thread.
class Core {
 public:
  using SessionId = std::uint64_t;
  // Receives one session's events: the event's name and its record. Answers false when the
  // receiver is falling behind: the source's deliveries are then held back a little each, so
  // that a source faster than its slowest receiver goes at that receiver's pace.
  using EventSink = std::function<bool(std::string_view event, ipc::Object record)>;

  // Serves `source` (none: a baseband that reports nothing), starting it at once or, if it asks
  // to, when a session first subscribes to metrics: its events are on and its peer has pushed a
  // configuration for its app. Stops it on destruction.
  explicit Core(std::shared_ptr<MetricSource> source = nullptr,
                std::vector<App> apps = registeredApps());
  ~Core();
  Core(const Core&) = delete;
  Core& operator=(const Core&) = delete;

  // A session receives the events of the app registered under its client name, as its peer has
  // configured them, once its events are on. Sinks run while the service holds its lock, so they
  // must not call back into it.
  SessionId openSession(const std::string& clientName, EventSink sink, std::string peer = {});
  // No sink call for the session runs after this returns.
  void closeSession(SessionId session);
  void setEventsOn(SessionId session, bool on);

  // Performs a command for the session's peer.
  CommandResult perform(SessionId session, std::string_view command, const ipc::Object& input);

 private:
  struct Session {
    std::string peer;
    std::optional<std::int64_t> appId;
    EventSink sink;
    bool eventsOn = false;
  };
  // The configuration of one app by one peer.
  using ConfigurationKey = std::pair<std::string, std::int64_t>;
  using Command = void (Core::*)(const std::string& peer, const Arguments&);

  static const std::unordered_map<std::string_view, Command>& commands();

  void addConfiguration(const std::string& peer, const Arguments& arguments);
  void clearConfiguration(const std::string& peer, const Arguments& arguments);
  void queryMetric(const std::string& peer, const Arguments& arguments);

  void startSource();
  // Whether some session receives metrics: its events are on and its peer has configured its
  // app. Needs mutex_ held.
  bool hasSubscriber() const;
  std::int64_t knownAppId(const Arguments& arguments) const;
  void deliver(const Metric& metric);
  // Needs mutex_ held. Answers false when a receiver is falling behind.
  bool sendToApp(const ConfigurationKey& app, std::string_view event, ipc::Object record);

  const std::vector<App> apps_;
  const std::shared_ptr<MetricSource> source_;
  std::once_flag sourceStarted_;

  std::mutex mutex_;
  std::map<SessionId, Session> sessions_;
  SessionId lastSession_ = 0;
  std::map<ConfigurationKey, Configuration> configurations_;
};

}  // namespace tarn::service
