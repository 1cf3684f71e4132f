// Seeking in a recorded hour: the store and the events rebuilt from the drive's start, as
// POST /api/replay {"action": "seek"} does, to the drive's middle and to its end.
#include <benchmark/benchmark.h>

#include <cstdlib>

#include "events/EventDetector.h"
#include "platform/Log.h"
#include "player/Player.h"
#include "store/MetricValidator.h"
#include "tarn/sim/Simulator.h"

namespace {

constexpr std::uint64_t kSeed = 1;
constexpr std::uint64_t kStartMs = 1718100000000;
constexpr std::uint64_t kHourMs = 60 * 60 * 1000;

player::Drive simulatedHour() {
  player::Drive drive;
  tarn::sim::Simulator simulator(kSeed, kStartMs);
  for (tarn::sim::TimedMetric& timed : simulator.advance(kHourMs)) {
    drive.metrics.push_back({static_cast<std::int64_t>(timed.atMs - kStartMs),
                             {{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                              {"kKeyPayload", std::move(timed.metric.payload)},
                              {"kKeyProfileID", std::int64_t{0}},
                              {"kKeyAppID", std::int64_t{2}}}});
  }
  return drive;
}

void BM_SeekInAnHour(benchmark::State& state) {
  setenv("TZ", "Europe/Berlin", 1);
  store::MetricValidator intake(nullptr);
  events::EventRing ring;
  events::EventDetector detector(ring);
  detector.watch(intake);
  player::Player player(
      simulatedHour(),
      {[&] {
         intake.clearStore();
         ring.clear();
         detector.reset();
       },
       [&intake](const platform::Dictionary& record) { intake.metricsDidUpdate(record); }},
      1.0, false, [] { return player::Player::Clock::now(); });
  const std::int64_t target = player.drive().durationMs() * state.range(0) / 100;
  for (auto _ : state) {
    // As the viewer does: the rebuild's intake lines are not written out.
    const platform::log::Capture quiet;
    player.seek(target);
  }
  state.counters["metrics"] = static_cast<double>(player.drive().metrics.size());
  state.counters["events"] = static_cast<double>(ring.size());
}
BENCHMARK(BM_SeekInAnHour)->Arg(50)->Arg(100)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
