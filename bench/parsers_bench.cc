// Growth of the parsers that read what Norvo takes from outside: time per key of a metric-log
// line, and time per line of a metric configuration, over three orders of magnitude. Flat
// figures show linear growth.
#include <benchmark/benchmark.h>

#include <string>

#include "tarn/log/MetricLog.h"
#include "tarn/service/Configuration.h"

namespace {

// A metric-log line of the usual record and `keys` more: {"kKeyMetricID":1,...,"k0":0,...}.
std::string lineWithKeys(std::size_t keys) {
  std::string line = R"({"kKeyMetricID":3952132,"kKeyPayload":"CAEQAg==","t_ms":250)";
  for (std::size_t i = 0; i < keys; ++i)
    line += ",\"k" + std::to_string(i) + "\":" + std::to_string(i);
  return line + "}";
}

void BM_MetricLogLinePerKey(benchmark::State& state) {
  const auto keys = static_cast<std::size_t>(state.range(0));
  const std::string line = lineWithKeys(keys);
  // The limits are raised to the line: this measures the parser, not the guard before it.
  const tarn::log::MetricLogLimits limits{.lineBytes = line.size(), .keys = keys + 3};
  for (auto _ : state) {
    const tarn::log::ParsedLine parsed = tarn::log::parseMetricLogLine(line, limits);
    if (!parsed.entry) state.SkipWithError(parsed.error.c_str());
    benchmark::DoNotOptimize(parsed);
  }
  // Seconds of CPU per key.
  state.counters["per_key"] =
      benchmark::Counter(static_cast<double>(keys), benchmark::Counter::kIsIterationInvariantRate |
                                                        benchmark::Counter::kInvert);
}
BENCHMARK(BM_MetricLogLinePerKey)
    ->Arg(1'000)
    ->Arg(10'000)
    ->Arg(100'000)
    ->Arg(1'000'000)
    ->Unit(benchmark::kMillisecond);

// A configuration of `lines` lines, each one metric ID and a comment.
std::string configurationOf(std::size_t lines) {
  std::string text;
  for (std::size_t i = 1; i <= lines; ++i)
    text += "0x" + std::to_string(i) + "  # metric " + std::to_string(i) + "\n";
  return text;
}

void BM_ConfigurationPerLine(benchmark::State& state) {
  const auto lines = static_cast<std::size_t>(state.range(0));
  const std::string text = configurationOf(lines);
  for (auto _ : state) {
    benchmark::DoNotOptimize(tarn::service::Configuration::parse(text));
  }
  state.counters["per_line"] =
      benchmark::Counter(static_cast<double>(lines), benchmark::Counter::kIsIterationInvariantRate |
                                                         benchmark::Counter::kInvert);
}
// The largest holds as many lines as the size limit allows.
BENCHMARK(BM_ConfigurationPerLine)
    ->Arg(1'000)
    ->Arg(10'000)
    ->Arg(40'000)
    ->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
