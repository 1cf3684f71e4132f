#include "tarn/mqtt/RemoteSource.h"

#include <boost/json/parse.hpp>

#include "platform/Log.h"
#include "tarn/Names.h"
#include "tarn/log/MetricLog.h"

namespace tarn::mqtt {

namespace {

// The baseband's metric IDs have 0x3C in bits 16 to 23 and the record's tag below; which of
// them the app takes is the intake's to judge, as it is for a local service.
bool isBasebandMetric(std::int64_t metricId) {
  return (metricId >> 16) == 0x3C;
}

ReadMetric refuseMetric(std::string error) {
  return {std::nullopt, std::move(error)};
}

std::string textAt(const boost::json::object& object, std::string_view key) {
  const boost::json::value* value = object.if_contains(key);
  return value != nullptr && value->is_string() ? std::string(value->get_string()) : std::string();
}

}  // namespace

ReadMetric readMetricMessage(std::string_view message) {
  if (message.size() > kLargestMetricMessage)
    return refuseMetric("too large (" + std::to_string(message.size()) + " bytes)");
  const log::ParsedLine parsed = log::parseMetricLogLine(message);
  if (!parsed.entry) return refuseMetric(parsed.error);
  const platform::Dictionary& record = parsed.entry->record;
  const platform::Value* id = record.find(kKeyMetricID);
  const std::optional<std::int64_t> metricId = id ? id->asInteger() : std::nullopt;
  if (!metricId) return refuseMetric("no integer \"kKeyMetricID\"");
  if (!isBasebandMetric(*metricId))
    return refuseMetric("unknown metric ID " + std::to_string(*metricId));
  const platform::Value* payload = record.find(kKeyPayload);
  if (payload == nullptr || !payload->isBytes()) return refuseMetric("no \"kKeyPayload\"");
  return {service::Metric{static_cast<std::uint32_t>(*metricId), *payload->asBytes()}, {}};
}

std::optional<DeviceStatus> readStatusMessage(std::string_view message) {
  boost::system::error_code error;
  const boost::json::value json = boost::json::parse(message, error);
  if (error || !json.is_object()) return std::nullopt;
  const boost::json::object& object = json.get_object();
  DeviceStatus status{textAt(object, "status"), textAt(object, "source"), 0};
  if (status.status.empty()) return std::nullopt;
  if (const boost::json::value* dropped = object.if_contains("dropped");
      dropped != nullptr && dropped->is_int64() && dropped->get_int64() > 0) {
    status.dropped = static_cast<std::uint64_t>(dropped->get_int64());
  }
  return status;
}

RemoteSource::RemoteSource(RemoteDevice device)
    : device_(std::move(device)),
      metricsTopic_(device_.broker.path + "/metrics"),
      statusTopic_(device_.broker.path + "/status"),
      latestTopics_(device_.broker.path + "/latest/") {}

RemoteSource::~RemoteSource() {
  stop();
}

void RemoteSource::start(std::function<void(service::Metric)> deliver) {
  if (link_) return;
  deliver_ = std::move(deliver);
  LinkOptions options;
  options.broker = device_.broker;
  options.caFile = device_.caFile;
  options.subscriptions = {metricsTopic_, statusTopic_, latestTopics_ + "+"};
  options.name = device_.name;
  const std::string broker = device_.broker.endpoint();
  brokerLink_->set(false, "connecting to the broker at " + broker);
  link_ = std::make_unique<Link>(
      std::move(options),
      Link::Handlers{
          .connected = [this,
                        broker] { brokerLink_->set(true, "connected to the broker at " + broker); },
          .disconnected =
              [this, broker] {
                brokerLink_->set(false, "lost the broker at " + broker + "; trying again");
              },
          .published = {},
          .message = [this](std::string_view topic,
                            std::string_view payload) { receive(topic, payload); },
          .subscribed = {},
      });
  link_->start();
}

void RemoteSource::stop() {
  link_.reset();
}

std::optional<service::Metric> RemoteSource::query(std::uint32_t metricId) {
  const std::lock_guard lock(mutex_);
  const auto latest = latest_.find(metricId);
  if (latest == latest_.end()) return std::nullopt;
  return latest->second;
}

DeviceStatus RemoteSource::status() const {
  const std::lock_guard lock(mutex_);
  return status_;
}

std::uint64_t RemoteSource::refused() const {
  const std::lock_guard lock(mutex_);
  return refused_;
}

void RemoteSource::receive(std::string_view topic, std::string_view payload) {
  if (topic == statusTopic_) {
    const std::optional<DeviceStatus> status = readStatusMessage(payload);
    if (!status) {
      platform::log::plain(device_.name + ": a status on " + statusTopic_ +
                           " that does not read; ignored");
      return;
    }
    const std::lock_guard lock(mutex_);
    if (status->status != status_.status) {
      platform::log::plain(device_.name + ": " + device_.broker.path + " is " + status->status +
                           (status->source.empty() ? "" : " (source: " + status->source + ")"));
    }
    status_ = *status;
    return;
  }
  const bool retained = topic.starts_with(latestTopics_);
  ReadMetric read = readMetricMessage(payload);
  {
    const std::lock_guard lock(mutex_);
    if (!read.metric) {
      ++refused_;
      platform::log::plain(device_.name + ": a message on " + std::string(topic) + " refused: " +
                           read.error + " (" + std::to_string(refused_) + " so far)");
      return;
    }
    // A retained metric is older than any that came live, and is only there for queries.
    if (retained) {
      latest_.try_emplace(read.metric->metricId, *read.metric);
      return;
    }
    latest_.insert_or_assign(read.metric->metricId, *read.metric);
  }
  // Outside the lock, as the service may ask for the latest metric while delivering. deliver_ is
  // set before the link starts and kept until it has stopped.
  deliver_(std::move(*read.metric));
}

}  // namespace tarn::mqtt
