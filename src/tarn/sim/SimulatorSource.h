#pragma once

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <stop_token>
#include <thread>

#include "tarn/service/MetricSource.h"
#include "tarn/service/SourceClock.h"
#include "tarn/sim/Simulator.h"

namespace tarn::sim {

// Runs the simulator on its own thread in real time, scaled by a speed factor (2 runs the
// drive twice as fast), and delivers each metric when its simulated time comes.
class SimulatorSource final : public service::MetricSource {
 public:
  // The fastest speed: a simulated day in under 10 s. Faster would only outrun every receiver,
  // which hold the source back anyway.
  static constexpr double kFastest = 10'000.0;

  // `speed` must be above 0 and at most kFastest (std::invalid_argument otherwise). Simulated
  // time starts at `startEpochMs`, or at the system clock's time of construction. The drive
  // advances in slices of simulated time, the lock released between them, so that query() and
  // stop() answer at once at any speed; a receiver that falls behind holds it back. Real time
  // is `clock`'s, the machine's steady clock unless given.
  explicit SimulatorSource(
      std::uint64_t seed, double speed = 1.0,
      std::optional<std::uint64_t> startEpochMs = std::nullopt,
      std::shared_ptr<service::SourceClock> clock = service::SteadyClock::shared());
  ~SimulatorSource() override;
  SimulatorSource(const SimulatorSource&) = delete;
  SimulatorSource& operator=(const SimulatorSource&) = delete;

  // Starts or, after stop(), resumes the drive where it stopped. Does nothing while running.
  void start(std::function<void(service::Metric)> deliver) override;
  // Must not be called from `deliver`.
  void stop() override;
  std::optional<service::Metric> query(std::uint32_t metricId) override;

 private:
  void run(std::stop_token stop, const std::function<void(service::Metric)>& deliver);

  const double speed_;
  const std::shared_ptr<service::SourceClock> clock_;
  std::mutex mutex_;  // guards the simulator
  // How many query() calls wait for mutex_: the worker lets them in before its next slice.
  std::atomic<int> queriesWaiting_{0};
  std::mutex workerMutex_;  // guards worker_
  Simulator simulator_;
  std::jthread worker_;
};

}  // namespace tarn::sim
