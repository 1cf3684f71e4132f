#include "tarn/replay/ReplaySource.h"

#include <chrono>
#include <fstream>
#include <limits>
#include <ostream>
#include <stdexcept>
#include <utility>

#include "messages/Metrics.h"
#include "tarn/log/MetricLog.h"

namespace tarn::replay {
namespace {

using messages::metric::KCellularSimCardFiles;

ReplayOptions checked(ReplayOptions options) {
  if (options.speed && !(*options.speed > 0.0))
    throw std::invalid_argument("the replay speed must be above 0");
  return options;
}

// The metric a record carries, or why it carries none.
std::optional<service::Metric> metricOf(const platform::Dictionary& record, std::string& error) {
  const platform::Value* id = record.find("kKeyMetricID");
  const std::optional<std::int64_t> metricId = id ? id->asInteger() : std::nullopt;
  if (!metricId || *metricId < 0 || *metricId > std::numeric_limits<std::uint32_t>::max()) {
    error = "no metric ID that fits 32 bits";
    return std::nullopt;
  }
  const platform::Value* payload = record.find("kKeyPayload");
  if (!payload || !payload->asBytes()) {
    error = "no \"kKeyPayload\"";
    return std::nullopt;
  }
  return service::Metric{static_cast<std::uint32_t>(*metricId), *payload->asBytes()};
}

}  // namespace

ReplaySource::ReplaySource(const std::string& path, ReplayOptions options, std::ostream& errors,
                           std::shared_ptr<service::SourceClock> clock)
    : options_(checked(options)), clock_(std::move(clock)) {
  std::ifstream file(path, std::ios::binary);
  if (!file) throw std::runtime_error("cannot read " + path);
  log::MetricLogReader reader(file);
  std::int64_t lastMs = 0;
  while (std::optional<log::MetricLogReader::Line> line = reader.next()) {
    std::string error = line->parsed.error;
    std::optional<service::Metric> metric;
    if (line->parsed.entry) metric = metricOf(line->parsed.entry->record, error);
    if (!metric) {
      errors << path << ':' << line->number << ": " << error << "; line skipped\n";
      continue;
    }
    lastMs = line->parsed.entry->deliveryMs.value_or(lastMs);
    if (metric->metricId == KCellularSimCardFiles) simFiles_ = *metric;
    metrics_.push_back({lastMs, std::move(*metric)});
  }
  if (reader.failed()) throw std::runtime_error("cannot read " + path + " to its end");
}

ReplaySource::~ReplaySource() {
  stop();
}

void ReplaySource::start(std::function<void(service::Metric)> deliver) {
  std::lock_guard lock(mutex_);
  if (worker_.joinable()) return;
  worker_ = std::jthread([this, deliver = std::move(deliver)](std::stop_token stop) {
    run(std::move(stop), deliver);
  });
}

void ReplaySource::stop() {
  std::jthread worker;
  {
    std::lock_guard lock(mutex_);
    worker = std::move(worker_);
  }
  // Leaving this scope asks the worker to stop and joins it.
}

std::optional<service::Metric> ReplaySource::query(std::uint32_t metricId) {
  if (metricId != KCellularSimCardFiles) return std::nullopt;
  return simFiles_;
}

void ReplaySource::run(std::stop_token stop, const std::function<void(service::Metric)>& deliver) {
  if (metrics_.empty()) return;
  const service::SourceClock::TimePoint began = clock_->now();
  // Log time at which the current pass began: each loop carries on from the last metric.
  std::int64_t passMs = 0;
  // The clock waits with a lock held; this one is the worker's alone, so that stop() never
  // waits for a worker that delivers without pause.
  std::mutex waiting;
  std::unique_lock lock(waiting);
  do {
    for (const Timed& timed : metrics_) {
      if (options_.speed) {
        const auto due =
            began + std::chrono::duration_cast<std::chrono::nanoseconds>(
                        std::chrono::duration<double, std::milli>(
                            static_cast<double>(passMs + timed.deliveryMs) / *options_.speed));
        if (clock_->waitUntil(lock, stop, due)) return;
      } else if (stop.stop_requested()) {
        return;
      }
      deliver(timed.metric);
    }
    passMs += metrics_.back().deliveryMs;
  } while (options_.loop);
}

}  // namespace tarn::replay
