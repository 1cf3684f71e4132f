#include "tarn/mqtt/PublishingSource.h"

#include <algorithm>

#include "tarn/Names.h"
#include "tarn/log/MetricLog.h"
#include "tarn/mqtt/BrokerAddress.h"

namespace tarn::mqtt {

namespace {

// Metrics that a baseband reports once, when it powers on, and later only when asked: the SIM
// files.
constexpr std::uint32_t kReportedOnce[] = {0x3C0013};

}  // namespace

PublishingSource::PublishingSource(std::shared_ptr<service::MetricSource> source,
                                   Publisher& publisher, std::string prefix, std::string device,
                                   Clock::time_point began)
    : source_(std::move(source)),
      publisher_(publisher),
      prefix_(std::move(prefix)),
      device_(std::move(device)),
      began_(began) {}

void PublishingSource::start(std::function<void(service::Metric)> deliver) {
  source_->start([this, deliver = std::move(deliver)](service::Metric metric) {
    publish(metric);
    deliver(std::move(metric));
  });
}

void PublishingSource::stop() {
  source_->stop();
}

std::optional<service::Metric> PublishingSource::query(std::uint32_t metricId) {
  return source_->query(metricId);
}

void PublishingSource::publish(const service::Metric& metric) {
  const auto sinceStart =
      std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - began_);
  const auto wallClock = std::chrono::duration_cast<std::chrono::milliseconds>(
      std::chrono::system_clock::now().time_since_epoch());
  std::string message = metricMessage(metric, std::max<std::int64_t>(sinceStart.count(), 0),
                                      device_, wallClock.count());
  if (std::ranges::count(kReportedOnce, metric.metricId) > 0)
    publisher_.retain(latestTopic(prefix_, device_, metric.metricId), message);
  publisher_.publish(std::move(message));
}

std::string metricMessage(const service::Metric& metric, std::int64_t deliveryMs,
                          const std::string& device, std::int64_t unixMs) {
  return *log::formatMetricLogLine({{std::string(kKeyMetricID), std::int64_t{metric.metricId}},
                                    {std::string(kKeyPayload), metric.payload}},
                                   deliveryMs, {{"device", device}, {"unix_ms", unixMs}});
}

}  // namespace tarn::mqtt
