// One hour of one series answered as chart columns.
#include <benchmark/benchmark.h>

#include <string>

#include "dashboard/SeriesApi.h"
#include "messages/Records.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"

namespace {

// An hour of GSM dedicated-mode measurements, the fastest series (every 480 ms), and /api/series
// asked for all of it.
void BM_AnswerAnHourOfOneSeries(benchmark::State& state) {
  constexpr std::int64_t kPeriodMs = 480;
  constexpr std::int64_t kHourMs = 3'600'000;
  std::int64_t clock = 1'700'000'000'000;
  series::SeriesStore series([&clock] { return clock; });
  store::MetricValidator intake(nullptr);
  intake.addStoreObserver([&series](store::DisplayDictionary replaced, const auto& store) {
    series.storeDidUpdate(replaced, store);
  });
  {
    const platform::log::Capture quiet;
    for (std::int64_t at = 0; at < kHourMs; at += kPeriodMs) {
      messages::KCellularGsmCsRfMeasurement measurement;
      measurement.setCsRxlevSub(static_cast<std::uint32_t>(10 + (at / kPeriodMs) % 50));
      intake.metricsDidUpdate({{"kKeyMetricID", store::MetricValidator::K_GSM_CS_RF_MEAS},
                               {"kKeyPayload", measurement.data()}});
      clock += kPeriodMs;
    }
  }
  const ui::web::QueryParameters parameters{{"name", "gsm.rxlev"},
                                            {"since", std::to_string(clock - kHourMs)}};
  std::size_t bytes = 0;
  for (auto _ : state) {
    const auto answer = dashboard::answerSeries(series, parameters);
    bytes = answer.json.size();
    benchmark::DoNotOptimize(answer.json.data());
  }
  state.counters["samples"] =
      static_cast<double>(series.since("gsm.rxlev", clock - kHourMs)->size());
  state.counters["bytes"] = static_cast<double>(bytes);
}
BENCHMARK(BM_AnswerAnHourOfOneSeries)->Unit(benchmark::kMicrosecond);

}  // namespace

BENCHMARK_MAIN();
