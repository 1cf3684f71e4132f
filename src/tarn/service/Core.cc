#include "tarn/service/Core.h"

#include <algorithm>
#include <chrono>
#include <thread>

#include "platform/Format.h"
#include "tarn/Names.h"
#include "tarn/service/Arguments.h"

namespace tarn::service {

namespace {

// The only payload type: configuration text.
constexpr std::int64_t kConfigurationText = 0;

// On-demand triggers ask for the metric with the same tag: trigger 0x7Fxxxx for metric 0x3Cxxxx.
constexpr std::int64_t kOnDemandTriggers = 0x7F0000;
constexpr std::uint32_t kMetrics = 0x3C0000;
constexpr std::int64_t kTagMask = 0xFFFF;

// How long a delivery waits when a receiver falls behind. Receivers take hundreds of metrics in
// this time, so a source held back this much per metric never outruns them for long.
constexpr auto kHoldBack = std::chrono::milliseconds(1);

std::uint32_t metricIdOf(std::int64_t value) {
  if (value <= 0 || value > 0xFFFFFFFF) {
    throw Refusal{status::kInvalidArgument,
                  platform::format("metric ID %lld is out of range (0x1 to 0xFFFFFFFF)", value)};
  }
  return static_cast<std::uint32_t>(value);
}

std::uint32_t metricIdOfTrigger(std::int64_t triggerId) {
  if ((triggerId & ~kTagMask) != kOnDemandTriggers) {
    throw Refusal{status::kInvalidArgument,
                  platform::format("trigger ID 0x%llX asks for no metric; on-demand triggers run "
                                   "from 0x7F0000 to 0x7FFFFF",
                                   triggerId)};
  }
  return kMetrics | static_cast<std::uint32_t>(triggerId & kTagMask);
}

ipc::Object metricRecord(const Metric& metric, std::int64_t profileId, std::int64_t appId) {
  return ipc::Object::dictionary({
      {std::string(kKeyMetricID), ipc::Object::integer(metric.metricId)},
      {std::string(kKeyPayload), ipc::Object::bytes(metric.payload)},
      {std::string(kKeyProfileID), ipc::Object::integer(profileId)},
      {std::string(kKeyAppID), ipc::Object::integer(appId)},
  });
}

}  // namespace

Core::Core(std::shared_ptr<MetricSource> source, std::vector<App> apps)
    : apps_(std::move(apps)), source_(std::move(source)) {
  if (source_ && !source_->startsWithFirstListener()) startSource();
}

Core::~Core() {
  if (source_) source_->stop();  // harmless when it never started
}

Core::SessionId Core::openSession(const std::string& clientName, EventSink sink, std::string peer) {
  const auto app = std::find_if(apps_.begin(), apps_.end(), [&clientName](const App& candidate) {
    return candidate.clientName == clientName;
  });
  Session session{.peer = std::move(peer),
                  .appId = app != apps_.end() ? std::optional(app->id) : std::nullopt,
                  .sink = std::move(sink)};
  const std::lock_guard lock(mutex_);
  const SessionId id = ++lastSession_;
  sessions_.emplace(id, std::move(session));
  return id;
}

void Core::closeSession(SessionId session) {
  EventSink closing;
  {
    const std::lock_guard lock(mutex_);
    const auto found = sessions_.find(session);
    if (found == sessions_.end()) return;
    closing = std::move(found->second.sink);
    const std::string peer = std::move(found->second.peer);
    sessions_.erase(found);
    const bool peerRemains =
        std::any_of(sessions_.begin(), sessions_.end(),
                    [&peer](const auto& open) { return open.second.peer == peer; });
    if (!peerRemains) {
      std::erase_if(configurations_,
                    [&peer](const auto& entry) { return entry.first.first == peer; });
    }
  }
  // The sink is released outside the lock: what it holds may be the last reference to a client.
}

void Core::setEventsOn(SessionId session, bool on) {
  bool subscribed = false;
  {
    const std::lock_guard lock(mutex_);
    const auto found = sessions_.find(session);
    if (found == sessions_.end()) return;
    found->second.eventsOn = on;
    subscribed = hasSubscriber();
  }
  if (subscribed) startSource();
}

bool Core::hasSubscriber() const {
  return std::any_of(sessions_.begin(), sessions_.end(), [this](const auto& open) {
    const Session& session = open.second;
    return session.eventsOn && session.appId &&
           configurations_.contains({session.peer, *session.appId});
  });
}

// Outside the lock: delivery takes it.
void Core::startSource() {
  std::call_once(sourceStarted_, [this] {
    if (source_) source_->start([this](const Metric& metric) { deliver(metric); });
  });
}

const std::unordered_map<std::string_view, Core::Command>& Core::commands() {
  static const std::unordered_map<std::string_view, Command> table = {
      {kCommandAddConfiguration, &Core::addConfiguration},
      {kCommandClearConfiguration, &Core::clearConfiguration},
      {kCommandQueryMetric, &Core::queryMetric},
  };
  return table;
}

CommandResult Core::perform(SessionId session, std::string_view command, const ipc::Object& input) {
  const auto found = commands().find(command);
  if (found == commands().end()) {
    return {status::kUnknownCommand, platform::format("unknown command '%s'", command)};
  }
  std::string peer;
  {
    const std::lock_guard lock(mutex_);
    const auto open = sessions_.find(session);
    if (open == sessions_.end()) return {status::kNoSession, "no session: it has been closed"};
    peer = open->second.peer;
  }
  try {
    (this->*found->second)(peer, Arguments(input));
    return {};
  } catch (const Refusal& refusal) {
    return {refusal.status, refusal.message};
  }
}

std::int64_t Core::knownAppId(const Arguments& arguments) const {
  const std::int64_t appId = arguments.integer(kKeyAppID);
  const bool known =
      std::any_of(apps_.begin(), apps_.end(), [appId](const App& app) { return app.id == appId; });
  if (!known) throw Refusal{status::kUnknownAppId, platform::format("unknown app ID %lld", appId)};
  return appId;
}

void Core::addConfiguration(const std::string& peer, const Arguments& arguments) {
  const std::int64_t appId = knownAppId(arguments);
  const std::int64_t payloadType = arguments.integer(kKeyPayloadType, kConfigurationText);
  if (payloadType != kConfigurationText) {
    throw Refusal{status::kInvalidArgument,
                  platform::format("unsupported payload type %lld", payloadType)};
  }
  const platform::Bytes& payload = arguments.bytes(kKeyPayload);
  try {
    Configuration configuration = Configuration::parse(
        std::string_view(reinterpret_cast<const char*>(payload.data()), payload.size()));
    bool subscribed = false;
    {
      const std::lock_guard lock(mutex_);
      configurations_.insert_or_assign({peer, appId}, std::move(configuration));
      subscribed = hasSubscriber();
    }
    if (subscribed) startSource();
  } catch (const ConfigurationError& error) {
    throw Refusal{status::kMalformedConfiguration,
                  platform::format("malformed configuration: %s", error.what())};
  }
}

void Core::clearConfiguration(const std::string& peer, const Arguments& arguments) {
  const std::int64_t appId = knownAppId(arguments);
  const std::lock_guard lock(mutex_);
  configurations_.erase({peer, appId});
}

void Core::queryMetric(const std::string& peer, const Arguments& arguments) {
  const std::int64_t appId = knownAppId(arguments);
  const std::int64_t triggerId = arguments.integer(kKeyTriggerID);
  const std::int64_t metricArgument = arguments.integer(kKeyMetricID, 0);
  const std::int64_t profileId = arguments.integer(kKeyProfileID, 0);
  const std::uint32_t metricId =
      metricArgument != 0 ? metricIdOf(metricArgument) : metricIdOfTrigger(triggerId);

  // Asked without the lock: the source may be delivering, and delivery takes the lock.
  const std::optional<Metric> answer = source_ ? source_->query(metricId) : std::nullopt;
  if (!answer) {
    throw Refusal{status::kNoSuchMetric,
                  platform::format("the baseband has no metric 0x%X to report", metricId)};
  }
  ipc::Object trigger = ipc::Object::dictionary({
      {std::string(kKeyAppID), ipc::Object::integer(appId)},
      {std::string(kKeyTriggerRef), ipc::Object::integer(arguments.integer(kKeyTriggerRef, 0))},
      {std::string(kKeyTriggerType), ipc::Object::integer(arguments.integer(kKeyTriggerType, 0))},
      {std::string(kKeyTriggerID), ipc::Object::integer(triggerId)},
      {std::string(kKeyProfileID), ipc::Object::integer(profileId)},
  });
  const ConfigurationKey app{peer, appId};
  // A query is answered whether or not its receiver keeps up: it is one metric, asked for.
  const std::lock_guard lock(mutex_);
  sendToApp(app, kEventTrigger, std::move(trigger));
  sendToApp(app, kEventMetric, metricRecord(*answer, profileId, appId));
}

void Core::deliver(const Metric& metric) {
  bool keptUp = true;
  {
    const std::lock_guard lock(mutex_);
    for (const auto& [app, configuration] : configurations_) {
      if (const std::optional<std::int64_t> profileId = configuration.profileOf(metric.metricId)) {
        keptUp &= sendToApp(app, kEventMetric, metricRecord(metric, *profileId, app.second));
      }
    }
  }
  // On the source's thread and outside the lock, so that commands go on meanwhile.
  if (!keptUp) std::this_thread::sleep_for(kHoldBack);
}

bool Core::sendToApp(const ConfigurationKey& app, std::string_view event, ipc::Object record) {
  // Each receiver but the last gets a copy.
  bool keptUp = true;
  const EventSink* previous = nullptr;
  for (const auto& [id, session] : sessions_) {
    if (!session.eventsOn || session.peer != app.first || session.appId != app.second) continue;
    if (previous != nullptr) keptUp &= (*previous)(event, record);
    previous = &session.sink;
  }
  if (previous != nullptr) keptUp &= (*previous)(event, std::move(record));
  return keptUp;
}

}  // namespace tarn::service
