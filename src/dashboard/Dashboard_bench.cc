// What the dashboard costs Norvo: one hour of one series answered as chart columns, and the
// answers of one steady-state refresh of an open dashboard.
#include <benchmark/benchmark.h>

#include <string>
#include <vector>

#include "dashboard/SeriesApi.h"
#include "dashboard/ServingCell.h"
#include "messages/Records.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"
#include "tarn/sim/Simulator.h"

namespace {

// The intake and the series store beside it, on a clock the benchmark sets.
struct Viewer {
  Viewer() {
    intake.addStoreObserver([this](store::DisplayDictionary replaced, const auto& store) {
      series.storeDidUpdate(replaced, store);
    });
  }

  void deliver(std::int64_t metricID, const platform::Bytes& payload) {
    intake.metricsDidUpdate({{"kKeyMetricID", metricID}, {"kKeyPayload", payload}});
  }

  std::int64_t clock = 1'718'100'000'000;
  series::SeriesStore series{[this] { return clock; }};
  store::MetricValidator intake{nullptr};
};

// An hour of GSM dedicated-mode measurements, the fastest series (every 480 ms), and /api/series
// asked for all of it.
void BM_AnswerAnHourOfOneSeries(benchmark::State& state) {
  constexpr std::int64_t kPeriodMs = 480;
  constexpr std::int64_t kHourMs = 3'600'000;
  Viewer viewer;
  {
    const platform::log::Capture quiet;
    for (std::int64_t at = 0; at < kHourMs; at += kPeriodMs) {
      messages::KCellularGsmCsRfMeasurement measurement;
      measurement.setCsRxlevSub(static_cast<std::uint32_t>(10 + (at / kPeriodMs) % 50));
      viewer.deliver(store::MetricValidator::K_GSM_CS_RF_MEAS, measurement.data());
      viewer.clock += kPeriodMs;
    }
  }
  const ui::web::QueryParameters parameters{{"name", "gsm.rxlev"},
                                            {"since", std::to_string(viewer.clock - kHourMs)}};
  std::size_t bytes = 0;
  for (auto _ : state) {
    const auto answer = dashboard::answerSeries(viewer.series, parameters);
    bytes = answer.json.size();
    benchmark::DoNotOptimize(answer.json.data());
  }
  state.counters["samples"] =
      static_cast<double>(viewer.series.since("gsm.rxlev", viewer.clock - kHourMs)->size());
  state.counters["bytes"] = static_cast<double>(bytes);
}
BENCHMARK(BM_AnswerAnHourOfOneSeries)->Unit(benchmark::kMicrosecond);

// Each iteration is one second of a simulated drive (10 minutes in first) and then what an open
// dashboard asks for in that second: the card, the list of series, and the new samples of each
// series that has some. Only the answers are timed, so the time per iteration is the CPU the
// dashboard's refresh adds per second, in the same units as a share of a core.
void BM_DashboardRefreshEachSecond(benchmark::State& state) {
  constexpr std::uint64_t kSeed = 20240611;
  constexpr std::uint64_t kWarmUpMs = 10 * 60 * 1000;
  Viewer viewer;
  tarn::sim::Simulator simulator(kSeed, static_cast<std::uint64_t>(viewer.clock));
  platform::log::Capture quiet;
  const auto drive = [&](std::uint64_t ms) {
    for (const tarn::sim::TimedMetric& timed : simulator.advance(ms)) {
      viewer.clock = static_cast<std::int64_t>(timed.atMs);
      viewer.deliver(timed.metric.metricId, timed.metric.payload);
    }
    viewer.clock += 1;
  };
  drive(kWarmUpMs);
  std::vector<std::int64_t> asked(viewer.series.definitions().size(), viewer.clock);
  std::size_t answers = 0;
  for (auto _ : state) {
    state.PauseTiming();
    drive(1000);
    quiet.clear();
    state.ResumeTiming();
    benchmark::DoNotOptimize(
        platform::toJson(dashboard::dashboardCard(viewer.intake, viewer.series)));
    benchmark::DoNotOptimize(dashboard::answerSeries(viewer.series, {}).json);
    answers += 2;
    for (std::size_t i = 0; i < asked.size(); ++i) {
      const std::string_view name = viewer.series.definitions()[i].name;
      const auto latest = viewer.series.latest(name);
      if (!latest || latest->timeMs < asked[i]) continue;
      benchmark::DoNotOptimize(
          dashboard::answerSeries(
              viewer.series, {{"name", std::string(name)}, {"since", std::to_string(asked[i])}})
              .json);
      asked[i] = latest->timeMs + 1;
      ++answers;
    }
  }
  state.counters["answers_per_refresh"] =
      static_cast<double>(answers) / static_cast<double>(state.iterations());
}
BENCHMARK(BM_DashboardRefreshEachSecond)->Unit(benchmark::kMicrosecond)->Iterations(600);

}  // namespace

BENCHMARK_MAIN();
