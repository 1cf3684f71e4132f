#include "tarn/sim/SimulatorSource.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <stdexcept>
#include <utility>
#include <vector>

#include "messages/Metrics.h"
#include "platform/Format.h"

namespace tarn::sim {
namespace {

// How often the worker wakes to deliver what has come due, in wall-clock time.
constexpr auto kTick = std::chrono::milliseconds(20);
// The most simulated time one step computes while it holds the lock: a few metrics, so that
// query() and stop() never wait long, whatever the speed.
constexpr double kSliceMs = 1'000.0;

std::uint64_t systemNowMs() {
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::milliseconds>(
                                        std::chrono::system_clock::now().time_since_epoch())
                                        .count());
}

double checkedSpeed(double speed) {
  if (!(speed > 0.0 && speed <= SimulatorSource::kFastest)) {
    throw std::invalid_argument(platform::format(
        "the simulator's speed must be above 0 and at most %g", SimulatorSource::kFastest));
  }
  return speed;
}

}  // namespace

SimulatorSource::SimulatorSource(std::uint64_t seed, double speed,
                                 std::optional<std::uint64_t> startEpochMs,
                                 std::shared_ptr<service::SourceClock> clock)
    : speed_(checkedSpeed(speed)),
      clock_(std::move(clock)),
      simulator_(seed, startEpochMs.value_or(systemNowMs())) {}

SimulatorSource::~SimulatorSource() {
  stop();
}

void SimulatorSource::start(std::function<void(service::Metric)> deliver) {
  std::lock_guard lock(workerMutex_);
  if (worker_.joinable()) return;
  worker_ = std::jthread([this, deliver = std::move(deliver)](std::stop_token stop) {
    run(std::move(stop), deliver);
  });
}

void SimulatorSource::stop() {
  std::jthread worker;
  {
    std::lock_guard lock(workerMutex_);
    worker = std::move(worker_);
  }
  // Leaving this scope asks the worker to stop and joins it.
}

std::optional<service::Metric> SimulatorSource::query(std::uint32_t metricId) {
  if (metricId != messages::metric::KCellularSimCardFiles) return std::nullopt;
  ++queriesWaiting_;
  std::lock_guard lock(mutex_);
  --queriesWaiting_;
  return simulator_.simFiles();
}

void SimulatorSource::run(std::stop_token stop,
                          const std::function<void(service::Metric)>& deliver) {
  const service::SourceClock::TimePoint began = clock_->now();
  double simulatedMs = 0.0;  // simulated time advanced since `began`
  std::unique_lock lock(mutex_);
  bool behind = false;  // more is due than the last slice covered: go on without waiting
  while (!(behind ? stop.stop_requested() : clock_->waitUntil(lock, stop, clock_->now() + kTick))) {
    const double wallMs = std::chrono::duration<double, std::milli>(clock_->now() - began).count();
    const double dueMs = std::floor(wallMs * speed_ - simulatedMs);
    behind = dueMs > kSliceMs;
    if (dueMs < 1.0) continue;
    const double sliceMs = std::min(dueMs, kSliceMs);
    simulatedMs += sliceMs;
    std::vector<TimedMetric> metrics = simulator_.advance(static_cast<std::uint64_t>(sliceMs));
    lock.unlock();
    for (TimedMetric& timed : metrics) {
      if (stop.stop_requested()) break;
      deliver(std::move(timed.metric));
    }
    // A worker that is behind would take the lock straight back, ahead of a waiting query.
    while (queriesWaiting_.load() > 0)
      std::this_thread::yield();
    lock.lock();
  }
}

}  // namespace tarn::sim
