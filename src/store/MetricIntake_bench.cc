// The whole intake of a metric (validation, decode, display dictionary, unit conversion, list
// copies, timestamp text and log lines) next to the decode and dictionary conversion alone, over
// the same simulated drive.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <vector>

#include "platform/Log.h"
#include "store/Dispatch.h"
#include "store/MetricValidator.h"
#include "tarn/sim/Simulator.h"

namespace {

using store::MetricValidator;

constexpr std::uint64_t kSeed = 20240611;
constexpr std::uint64_t kStartMs = 1718100000000;  // 2024-06-11 10:00:00 UTC
constexpr std::uint64_t kDriveMs = 10 * 60 * 1000;

struct Corpus {
  std::vector<platform::Dictionary> records;  // as the session hands them over
  std::vector<const store::Handler*> handlers;
  std::vector<platform::Bytes> payloads;
};

// Sends standard output, where the plain log lines go, to /dev/null while alive: the lines are
// built and written in full, as when the program's output goes to a file.
class DiscardedStandardOutput {
 public:
  DiscardedStandardOutput() : saved_(dup(STDOUT_FILENO)) {
    std::fflush(stdout);
    const int null = open("/dev/null", O_WRONLY);
    dup2(null, STDOUT_FILENO);
    close(null);
  }
  ~DiscardedStandardOutput() {
    std::fflush(stdout);
    dup2(saved_, STDOUT_FILENO);
    close(saved_);
  }
  DiscardedStandardOutput(const DiscardedStandardOutput&) = delete;
  DiscardedStandardOutput& operator=(const DiscardedStandardOutput&) = delete;

 private:
  int saved_;
};

// NORVO_INTAKE_PASSES=n fixes the number of passes of every loop, for instruction counts: with
// callgrind, the difference between n and 1 passes is what n - 1 passes cost, without the
// set-up.
void fixPassesFromEnvironment(benchmark::internal::Benchmark* loop) {
  if (const char* passes = std::getenv("NORVO_INTAKE_PASSES")) {
    loop->Iterations(std::max<benchmark::IterationCount>(std::atoll(passes), 1));
  }
}

// Ten minutes of a simulated drive, the metrics the store converts.
const Corpus& corpus() {
  static const Corpus* const drive = [] {
    auto* built = new Corpus;
    tarn::sim::Simulator simulator(kSeed, kStartMs);
    for (const tarn::sim::TimedMetric& timed : simulator.advance(kDriveMs)) {
      const store::Handler* handler = store::handlerFor(timed.metric.metricId);
      if (handler == nullptr) continue;
      built->handlers.push_back(handler);
      built->payloads.push_back(timed.metric.payload);
      built->records.push_back({{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                                {"kKeyPayload", timed.metric.payload},
                                {"kKeyProfileID", std::int64_t{1}},
                                {"kKeyAppID", std::int64_t{2}}});
    }
    return built;
  }();
  return *drive;
}

void BM_DecodeAndDictionary(benchmark::State& state) {
  const Corpus& metrics = corpus();
  // The decoder logs the fields it consumes as metric-ID tags.
  const DiscardedStandardOutput quiet;
  for (auto _ : state) {
    for (std::size_t i = 0; i < metrics.payloads.size(); ++i) {
      benchmark::DoNotOptimize(metrics.handlers[i]->decode(&metrics.payloads[i]));
    }
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(metrics.payloads.size()));
}
BENCHMARK(BM_DecodeAndDictionary)->Unit(benchmark::kMillisecond)->Apply(fixPassesFromEnvironment);

void BM_WholeIntake(benchmark::State& state) {
  setenv("TZ", "Europe/Berlin", 1);
  const Corpus& metrics = corpus();
  MetricValidator intake(nullptr);
  const DiscardedStandardOutput quiet;
  for (auto _ : state) {
    for (const platform::Dictionary& record : metrics.records)
      intake.metricsDidUpdate(record);
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(metrics.records.size()));
}
BENCHMARK(BM_WholeIntake)->Unit(benchmark::kMillisecond)->Apply(fixPassesFromEnvironment);

// As the programs run it: the log lines are made and written on the log's writer thread. CPU
// time is the main thread's, or with MeasureProcessCPUTime that of both; each pass ends once
// its lines are written.
void BM_WholeIntakeLoggingOffThread(benchmark::State& state) {
  setenv("TZ", "Europe/Berlin", 1);
  const Corpus& metrics = corpus();
  MetricValidator intake(nullptr);
  const DiscardedStandardOutput quiet;
  const platform::log::WriterThread writer;
  for (auto _ : state) {
    for (const platform::Dictionary& record : metrics.records)
      intake.metricsDidUpdate(record);
    platform::log::drain();
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(metrics.records.size()));
}
BENCHMARK(BM_WholeIntakeLoggingOffThread)
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime()
    ->Apply(fixPassesFromEnvironment);
BENCHMARK(BM_WholeIntakeLoggingOffThread)
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime()
    ->MeasureProcessCPUTime()
    ->Apply(fixPassesFromEnvironment);

}  // namespace

BENCHMARK_MAIN();
