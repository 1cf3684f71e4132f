#include "tarn/sim/SimulatorSource.h"

#include <gtest/gtest.h>

#include <chrono>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <vector>

#include "messages/Metrics.h"

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

TEST(ASimulatorSource, RunsSimulatedTimeAtItsSpeedAndStopsDeliveringWhenStopped) {
  constexpr double kSpeed = 40.0;
  SimulatorSource source(2, kSpeed, kStartMs);
  Received received;
  const auto began = std::chrono::steady_clock::now();
  source.start(received.sink());
  std::this_thread::sleep_for(300ms);
  source.stop();
  const double wallMs =
      std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - began).count();

  const auto metrics = received.metrics();
  ASSERT_FALSE(metrics.empty());
  const double simulatedMs = static_cast<double>(timestampOf(metrics.back()) - kStartMs);
  EXPECT_LE(simulatedMs, wallMs * kSpeed);
  EXPECT_GE(simulatedMs, 0.5 * wallMs * kSpeed);

  std::this_thread::sleep_for(50ms);
  EXPECT_EQ(received.metrics().size(), metrics.size());
}

TEST(ASimulatorSource, ResumesTheDriveWhereItStopped) {
  SimulatorSource source(2, 50.0, kStartMs);
  Received first;
  source.start(first.sink());
  std::this_thread::sleep_for(100ms);
  source.stop();
  Received second;
  source.start(second.sink());
  std::this_thread::sleep_for(100ms);
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
