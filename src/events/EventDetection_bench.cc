// What event detection adds to the whole intake of a metric: the same simulated drive through
// the intake alone and through the intake with the detectors behind it, as the viewer runs them.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <vector>

#include "events/EventDetector.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"
#include "tarn/sim/Simulator.h"

namespace {

constexpr std::uint64_t kSeed = 20240611;
constexpr std::uint64_t kStartMs = 1718100000000;  // 2024-06-11 10:00:00 UTC
constexpr std::uint64_t kDriveMs = 10 * 60 * 1000;

// Ten minutes of a simulated drive, as the session hands the metrics over.
const std::vector<platform::Dictionary>& drive() {
  static const auto* const records = [] {
    auto* built = new std::vector<platform::Dictionary>;
    tarn::sim::Simulator simulator(kSeed, kStartMs);
    for (const tarn::sim::TimedMetric& timed : simulator.advance(kDriveMs)) {
      built->push_back({{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                        {"kKeyPayload", timed.metric.payload},
                        {"kKeyProfileID", std::int64_t{1}},
                        {"kKeyAppID", std::int64_t{2}}});
    }
    return built;
  }();
  return *records;
}

void runDrive(benchmark::State& state, store::MetricValidator& intake) {
  setenv("TZ", "Europe/Berlin", 1);
  const std::vector<platform::Dictionary>& records = drive();
  // The lines are made in full either way; keeping them in memory leaves the terminal out.
  platform::log::Capture lines;
  for (auto _ : state) {
    for (const platform::Dictionary& record : records)
      intake.metricsDidUpdate(record);
    state.PauseTiming();
    lines.clear();
    state.ResumeTiming();
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(records.size()));
}

void BM_IntakeAlone(benchmark::State& state) {
  store::MetricValidator intake(nullptr);
  runDrive(state, intake);
}
BENCHMARK(BM_IntakeAlone)->Unit(benchmark::kMillisecond);

void BM_IntakeWithEventDetection(benchmark::State& state) {
  store::MetricValidator intake(nullptr);
  events::EventRing ring;
  events::EventDetector detector(ring);
  detector.watch(intake);
  runDrive(state, intake);
  state.counters["events_per_drive"] = benchmark::Counter(static_cast<double>(ring.nextId() - 1) /
                                                          static_cast<double>(state.iterations()));
}
BENCHMARK(BM_IntakeWithEventDetection)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
