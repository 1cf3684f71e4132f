#pragma once

#include <cstdint>
#include <functional>
#include <iosfwd>
#include <memory>
#include <mutex>
#include <optional>
#include <stop_token>
#include <string>
#include <thread>
#include <vector>

#include "tarn/service/MetricSource.h"
#include "tarn/service/SourceClock.h"

namespace tarn::replay {

struct ReplayOptions {
  // How many times faster than recorded the "t_ms" gaps pass (2 halves them); empty delivers
  // every metric as fast as possible. Must be above 0 (std::invalid_argument otherwise).
  std::optional<double> speed = 1.0;
  // Starts over after the last metric, until stopped.
  bool loop = false;
};

// Delivers the metrics of a metric log on its own thread, in the order of the log and at the
// times its "t_ms" keys give. A line without "t_ms" comes right after the line before it.
class ReplaySource final : public service::MetricSource {
 public:
  // Reads the whole log at `path` now. A line that does not parse, or whose record lacks an
  // integer "kKeyMetricID" or a payload, is reported on `errors` as "PATH:LINE: ..." and skipped.
  // Throws std::runtime_error when the file cannot be read. The "t_ms" gaps pass on `clock`,
  // the machine's steady clock unless given.
  ReplaySource(const std::string& path, ReplayOptions options, std::ostream& errors,
               std::shared_ptr<service::SourceClock> clock = service::SteadyClock::shared());
  ~ReplaySource() override;
  ReplaySource(const ReplaySource&) = delete;
  ReplaySource& operator=(const ReplaySource&) = delete;

  // Replays from the start of the log. Does nothing while running.
  void start(std::function<void(service::Metric)> deliver) override;
  // Must not be called from `deliver`.
  void stop() override;
  // For the SIM files (0x3C0013), the last such metric in the log, wherever the replay stands.
  std::optional<service::Metric> query(std::uint32_t metricId) override;
  // A drive plays from its start to its first listener.
  bool startsWithFirstListener() const override { return true; }

 private:
  struct Timed {
    std::int64_t deliveryMs;
    service::Metric metric;
  };

  void run(std::stop_token stop, const std::function<void(service::Metric)>& deliver);

  const ReplayOptions options_;
  const std::shared_ptr<service::SourceClock> clock_;
  std::vector<Timed> metrics_;
  std::optional<service::Metric> simFiles_;
  std::mutex mutex_;  // guards the worker
  std::jthread worker_;
};

}  // namespace tarn::replay
