#include "tarn/log/RecordingSource.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "platform/Log.h"
#include "tarn/Names.h"

namespace tarn::log {

RecordingSource::RecordingSource(std::shared_ptr<service::MetricSource> source, std::ostream& log,
                                 std::string logName, Clock::time_point began)
    : source_(std::move(source)),
      logName_(std::move(logName)),
      began_(began),
      log_(log),
      writer_(log) {}

void RecordingSource::start(std::function<void(service::Metric)> deliver) {
  source_->start([this, deliver = std::move(deliver)](service::Metric metric) {
    record(metric);
    deliver(std::move(metric));
  });
}

void RecordingSource::stop() {
  source_->stop();
}

std::optional<service::Metric> RecordingSource::query(std::uint32_t metricId) {
  return source_->query(metricId);
}

void RecordingSource::record(const service::Metric& metric) {
  if (writeFailed_) return;
  const auto sinceStart =
      std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - began_);
  writer_.write({{std::string(kKeyMetricID), std::int64_t{metric.metricId}},
                 {std::string(kKeyPayload), metric.payload}},
                std::max<std::int64_t>(sinceStart.count(), 0));
  log_.flush();
  if (!log_) {
    writeFailed_ = true;
    platform::log::warningf("cannot write %s (%s); recording stopped", logName_,
                            std::strerror(errno));
  }
}

}  // namespace tarn::log
