#pragma once

#include <chrono>
#include <memory>
#include <string>

#include "tarn/mqtt/Publisher.h"
#include "tarn/service/MetricSource.h"

namespace tarn::mqtt {

// Hands on what another metric source produces and publishes each metric as it passes: one
// metric log line with "t_ms" counted from `began`, the device's name under "device" and the
// wall-clock time under "unix_ms" (milliseconds since 1970). Metrics that the baseband reports
// only once (the SIM files) are also kept retained on PREFIX/DEVICE/latest/ID. Query answers
// pass unpublished.
class PublishingSource final : public service::MetricSource {
 public:
  using Clock = std::chrono::steady_clock;

  // `publisher` must outlive the source.
  PublishingSource(std::shared_ptr<service::MetricSource> source, Publisher& publisher,
                   std::string prefix, std::string device, Clock::time_point began = Clock::now());

  void start(std::function<void(service::Metric)> deliver) override;
  void stop() override;
  std::optional<service::Metric> query(std::uint32_t metricId) override;
  bool startsWithFirstListener() const override { return source_->startsWithFirstListener(); }

 private:
  void publish(const service::Metric& metric);

  const std::shared_ptr<service::MetricSource> source_;
  Publisher& publisher_;
  const std::string prefix_;
  const std::string device_;
  const Clock::time_point began_;
};

// The message for one metric, as PublishingSource publishes it.
std::string metricMessage(const service::Metric& metric, std::int64_t deliveryMs,
                          const std::string& device, std::int64_t unixMs);

}  // namespace tarn::mqtt
