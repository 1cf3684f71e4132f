// How long query() and stop() of a metric source take while it runs flat out: the simulator at
// its fastest speed and a replay of a simulated drive as fast as it can go, looping. The
// receiver takes each metric at once, so the source never waits for it. Each query and each
// stop is timed on its own; the counters give the mean, the 99th percentile and the worst.
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "messages/Metrics.h"
#include "tarn/log/MetricLog.h"
#include "tarn/replay/ReplaySource.h"
#include "tarn/sim/Simulator.h"
#include "tarn/sim/SimulatorSource.h"

namespace {

using Clock = std::chrono::steady_clock;
using tarn::service::MetricSource;

constexpr std::uint64_t kStartMs = 1718100000000;  // 2024-06-11 10:00:00 UTC
constexpr std::uint32_t kSimFiles = messages::metric::KCellularSimCardFiles;

// Ten simulated minutes of a drive as a metric log, written once and removed at exit.
class DriveLog {
 public:
  DriveLog()
      : path_((std::filesystem::temp_directory_path() /
               ("norvo-answers-bench-" + std::to_string(::getpid()) + ".jsonl"))
                  .string()) {
    std::ofstream file(path_, std::ios::binary | std::ios::trunc);
    tarn::log::MetricLogWriter writer(file);
    tarn::sim::Simulator simulator(20240611, kStartMs);
    for (const tarn::sim::TimedMetric& timed : simulator.advance(10 * 60 * 1000)) {
      writer.write({{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                    {"kKeyPayload", timed.metric.payload}},
                   static_cast<std::int64_t>(timed.atMs - kStartMs));
    }
  }
  ~DriveLog() { std::filesystem::remove(path_); }
  DriveLog(const DriveLog&) = delete;
  DriveLog& operator=(const DriveLog&) = delete;

  const std::string& path() const { return path_; }

 private:
  std::string path_;
};

const std::string& driveLog() {
  static const DriveLog log;
  return log.path();
}

std::unique_ptr<MetricSource> fastestSimulator() {
  return std::make_unique<tarn::sim::SimulatorSource>(1, tarn::sim::SimulatorSource::kFastest,
                                                      kStartMs);
}

std::unique_ptr<MetricSource> replayAtSpeedMax() {
  std::ostringstream errors;
  return std::make_unique<tarn::replay::ReplaySource>(
      driveLog(), tarn::replay::ReplayOptions{.speed = std::nullopt, .loop = true}, errors);
}

class Latencies {
 public:
  void add(Clock::duration took) {
    microseconds_.push_back(std::chrono::duration<double, std::micro>(took).count());
  }
  void report(benchmark::State& state, std::atomic<std::uint64_t>& delivered) {
    std::sort(microseconds_.begin(), microseconds_.end());
    double sum = 0;
    for (const double one : microseconds_)
      sum += one;
    const auto at = [this](double share) {
      return microseconds_[static_cast<std::size_t>(share *
                                                    static_cast<double>(microseconds_.size() - 1))];
    };
    state.counters["mean_us"] = sum / static_cast<double>(microseconds_.size());
    state.counters["p99_us"] = at(0.99);
    state.counters["max_us"] = at(1.0);
    state.counters["metrics_delivered"] = static_cast<double>(delivered.load());
  }

 private:
  std::vector<double> microseconds_;
};

// The SIM file query, asked over and over while the source delivers.
template <std::unique_ptr<MetricSource> (*Make)()>
void BM_QueryWhileRunning(benchmark::State& state) {
  const std::unique_ptr<MetricSource> source = Make();
  std::atomic<std::uint64_t> delivered{0};
  source->start([&delivered](const tarn::service::Metric&) { ++delivered; });
  Latencies latencies;
  for (auto _ : state) {
    const Clock::time_point asked = Clock::now();
    benchmark::DoNotOptimize(source->query(kSimFiles));
    latencies.add(Clock::now() - asked);
  }
  source->stop();
  latencies.report(state, delivered);
}
BENCHMARK_TEMPLATE(BM_QueryWhileRunning, fastestSimulator)->Iterations(20'000);
BENCHMARK_TEMPLATE(BM_QueryWhileRunning, replayAtSpeedMax)->Iterations(20'000);

// stop() of a source that has been delivering flat out for 20 ms.
template <std::unique_ptr<MetricSource> (*Make)()>
void BM_StopWhileRunning(benchmark::State& state) {
  Latencies latencies;
  std::atomic<std::uint64_t> delivered{0};
  for (auto _ : state) {
    state.PauseTiming();
    const std::unique_ptr<MetricSource> source = Make();
    source->start([&delivered](const tarn::service::Metric&) { ++delivered; });
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    state.ResumeTiming();
    const Clock::time_point asked = Clock::now();
    source->stop();
    latencies.add(Clock::now() - asked);
  }
  latencies.report(state, delivered);
}
BENCHMARK_TEMPLATE(BM_StopWhileRunning, fastestSimulator)->Iterations(100)->UseRealTime();
BENCHMARK_TEMPLATE(BM_StopWhileRunning, replayAtSpeedMax)->Iterations(100)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
