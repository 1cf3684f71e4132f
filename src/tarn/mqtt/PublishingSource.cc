#include "tarn/mqtt/PublishingSource.h"

#include <algorithm>

#include "tarn/Names.h"
#include "tarn/log/MetricLog.h"

namespace tarn::mqtt {

PublishingSource::PublishingSource(std::shared_ptr<service::MetricSource> source,
                                   Publisher& publisher, std::string device,
                                   Clock::time_point began)
    : source_(std::move(source)),
      publisher_(publisher),
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
  publisher_.publish(metricMessage(metric, std::max<std::int64_t>(sinceStart.count(), 0), device_,
                                   wallClock.count()));
}

std::string metricMessage(const service::Metric& metric, std::int64_t deliveryMs,
                          const std::string& device, std::int64_t unixMs) {
  return *log::formatMetricLogLine({{std::string(kKeyMetricID), std::int64_t{metric.metricId}},
                                    {std::string(kKeyPayload), metric.payload}},
                                   deliveryMs, {{"device", device}, {"unix_ms", unixMs}});
}

}  // namespace tarn::mqtt
