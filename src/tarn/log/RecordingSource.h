#pragma once

#include <atomic>
#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <ostream>
#include <string>

#include "tarn/log/MetricLog.h"
#include "tarn/service/MetricSource.h"

namespace tarn::log {

// Hands on what another metric source produces and writes each metric to a metric log as it
// passes, with "t_ms" counted from `began`, so that replaying the log feeds a service the same
// metrics in the same order. Query answers are passed through unrecorded: a replay answers its
// queries from the metrics it replays.
class RecordingSource final : public service::MetricSource {
 public:
  using Clock = std::chrono::steady_clock;

  // `log` must outlive the source. Each line is flushed as it is written, so that the log holds
  // everything delivered so far should the process end abruptly. When a line cannot be written
  // (a full disk, say), recording stops at once with a warning that names `logName`; the metrics
  // are still handed on. writeFailed() tells afterwards.
  RecordingSource(std::shared_ptr<service::MetricSource> source, std::ostream& log,
                  std::string logName = "the metric log", Clock::time_point began = Clock::now());

  void start(std::function<void(service::Metric)> deliver) override;
  void stop() override;
  std::optional<service::Metric> query(std::uint32_t metricId) override;
  bool startsWithFirstListener() const override { return source_->startsWithFirstListener(); }

  bool writeFailed() const { return writeFailed_; }

 private:
  // Called on the wrapped source's delivery thread only.
  void record(const service::Metric& metric);

  const std::shared_ptr<service::MetricSource> source_;
  const std::string logName_;
  const Clock::time_point began_;
  std::atomic<bool> writeFailed_ = false;
  std::ostream& log_;
  MetricLogWriter writer_;
};

}  // namespace tarn::log
