#include "tarn/sim/SimulatorSource.h"

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <vector>

#include "messages/Metrics.h"
#include "tarn/testing/ManualClock.h"

namespace tarn::sim {
namespace {

using namespace std::chrono_literals;

constexpr std::uint64_t kStartMs = 1'700'000'000'000;

// Field 1 of every record is its timestamp.
std::uint64_t timestampOf(const service::Metric& metric) {
  std::uint64_t value = 0;
  for (std::size_t i = 1, shift = 0; i < metric.payload.size(); ++i, shift += 7) {
    value |= static_cast<std::uint64_t>(metric.payload[i] & 0x7F) << shift;
    if ((metric.payload[i] & 0x80) == 0) break;
  }
  return value;
}

class Received {
 public:
  std::function<void(service::Metric)> sink() {
    return [this](service::Metric metric) {
      std::lock_guard lock(mutex_);
      metrics_.push_back(std::move(metric));
    };
  }
  std::vector<service::Metric> metrics() {
    std::lock_guard lock(mutex_);
    return metrics_;
  }

 private:
  std::mutex mutex_;
  std::vector<service::Metric> metrics_;
};

// Moves the clock on by `wall` in the worker's ticks, each time until the worker has delivered
// what came due.
void runFor(testing::ManualClock& clock, std::chrono::milliseconds wall) {
  for (auto passed = 0ms; passed < wall; passed += 20ms) {
    clock.awaitWaiter();
    clock.advance(20ms);
  }
  clock.awaitWaiter();
}

TEST(ASimulatorSource, RunsSimulatedTimeAtItsSpeedAndStopsDeliveringWhenStopped) {
  // At the fastest speed a tick is 200 s of simulated time, delivered in slices of 1 s.
  for (const double speed : {40.0, SimulatorSource::kFastest}) {
    const auto clock = std::make_shared<testing::ManualClock>();
    SimulatorSource source(2, speed, kStartMs, clock);
    Received received;
    source.start(received.sink());
    runFor(*clock, 300ms);
    source.stop();

    const auto metrics = received.metrics();
    ASSERT_FALSE(metrics.empty()) << speed;
    const double simulatedMs = static_cast<double>(timestampOf(metrics.back()) - kStartMs);
    EXPECT_LE(simulatedMs, 300 * speed) << speed;
    // RSRP samples come every 1.75 s of simulated time.
    EXPECT_GT(simulatedMs, 300 * speed - 1750) << speed;

    clock->advance(1h);
    EXPECT_EQ(received.metrics().size(), metrics.size()) << speed;
  }
}

TEST(ASimulatorSource, ResumesTheDriveWhereItStopped) {
  const auto clock = std::make_shared<testing::ManualClock>();
  SimulatorSource source(2, 50.0, kStartMs, clock);
  Received first;
  source.start(first.sink());
  runFor(*clock, 100ms);
  source.stop();
  Received second;
  source.start(second.sink());
  runFor(*clock, 100ms);
  source.stop();
  ASSERT_FALSE(first.metrics().empty());
  ASSERT_FALSE(second.metrics().empty());
  EXPECT_GE(timestampOf(second.metrics().front()), timestampOf(first.metrics().back()));
}

TEST(ASimulatorSource, RefusesASpeedThatIsNotAboveZero) {
  EXPECT_THROW(SimulatorSource(1, 0.0), std::invalid_argument);
  EXPECT_THROW(SimulatorSource(1, -2.0), std::invalid_argument);
}

TEST(ASimulatorSource, AnswersAQueryForTheSimFilesOnly) {
  SimulatorSource source(2, 1.0, kStartMs);
  const auto files = source.query(messages::metric::KCellularSimCardFiles);
  ASSERT_TRUE(files);
  EXPECT_EQ(files->metricId, messages::metric::KCellularSimCardFiles);
  EXPECT_EQ(timestampOf(*files), kStartMs);
  EXPECT_FALSE(source.query(messages::metric::KCellularLteRrcState));
}

}  // namespace
}  // namespace tarn::sim
