#include "fleet/Fleet.h"

#include "platform/Json.h"
#include "platform/Value.h"
#include "tarn/mqtt/BrokerAddress.h"
#include "tarn/mqtt/RemoteSource.h"

namespace fleet {

namespace {

constexpr std::string_view kMetrics = "/metrics";
constexpr std::string_view kStatus = "/status";

platform::Value ageOf(const DeviceSummary& summary, std::int64_t nowMs) {
  if (!summary.lastMetricMs) return {};
  return std::max<std::int64_t>(nowMs - *summary.lastMetricMs, 0);
}

}  // namespace

Fleet::Fleet(std::string prefix) : prefix_(std::move(prefix)) {}

void Fleet::receive(std::string_view topic, std::string_view payload, std::int64_t nowMs) {
  if (!topic.starts_with(prefix_) || topic.size() <= prefix_.size() + 1 ||
      topic[prefix_.size()] != '/')
    return;
  std::string_view rest = topic.substr(prefix_.size() + 1);
  const bool metrics = rest.ends_with(kMetrics);
  const bool status = rest.ends_with(kStatus);
  if (!metrics && !status) return;
  const std::string_view device =
      rest.substr(0, rest.size() - (metrics ? kMetrics : kStatus).size());
  if (!tarn::mqtt::isTopicLevel(device)) return;

  if (status) {
    const auto read = tarn::mqtt::readStatusMessage(payload);
    const std::lock_guard lock(mutex_);
    DeviceSummary& summary = devices_[std::string(device)];
    if (!read) {
      ++summary.refused;
      return;
    }
    summary.status = read->status;
    summary.source = read->source;
    summary.dropped = read->dropped;
    return;
  }
  const tarn::mqtt::ReadMetric read = tarn::mqtt::readMetricMessage(payload);
  const std::lock_guard lock(mutex_);
  auto found = devices_.find(device);
  if (found == devices_.end()) found = devices_.emplace(std::string(device), DeviceSummary{}).first;
  DeviceSummary& summary = found->second;
  if (!read.metric) {
    ++summary.refused;
    return;
  }
  ++summary.metrics;
  summary.lastMetricMs = nowMs;
  summarise(summary, *read.metric);
}

std::string Fleet::json(std::int64_t nowMs) const {
  platform::List devices;
  {
    const std::lock_guard lock(mutex_);
    devices.reserve(devices_.size());
    for (const auto& [name, summary] : devices_) {
      const platform::Value age = ageOf(summary, nowMs);
      const bool silent = !age.asInteger() || *age.asInteger() >= kSilentAfterMs;
      devices.push_back(platform::Dictionary{
          {"device", name},
          {"status", summary.status},
          {"source", summary.source},
          {"technology", summary.technology},
          {"network", summary.network},
          {"cell", summary.cell},
          {"band", summary.band},
          {"levels", summary.levels},
          {"metrics", static_cast<std::int64_t>(summary.metrics)},
          {"refused", static_cast<std::int64_t>(summary.refused)},
          {"dropped", static_cast<std::int64_t>(summary.dropped)},
          {"age_ms", age},
          {"silent", silent},
      });
    }
  }
  return platform::toJson(
      platform::Dictionary{{"prefix", prefix_}, {"devices", std::move(devices)}});
}

std::size_t Fleet::size() const {
  const std::lock_guard lock(mutex_);
  return devices_.size();
}

}  // namespace fleet
