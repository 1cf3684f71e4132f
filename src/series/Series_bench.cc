// Appending a sample, and reading an hour of one series back.
#include <benchmark/benchmark.h>

#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <new>
#include <vector>

#include "series/SeriesStore.h"

namespace {

std::atomic<std::size_t> allocations{0};

}  // namespace

// Counts what the benchmarks allocate, to show that appending allocates nothing. GCC cannot see
// that these replacements pair malloc with free.
#pragma GCC diagnostic ignored "-Wmismatched-new-delete"
void* operator new(std::size_t size) {
  allocations.fetch_add(1, std::memory_order_relaxed);
  if (void* memory = std::malloc(size == 0 ? 1 : size)) return memory;
  throw std::bad_alloc();
}
void operator delete(void* memory) noexcept {
  std::free(memory);
}
void operator delete(void* memory, std::size_t) noexcept {
  std::free(memory);
}

namespace {

constexpr std::int64_t kStartMs = 1'700'000'000'000;

void BM_Append(benchmark::State& state) {
  series::SampleRing ring(series::SeriesStore::kCapacity);
  std::int64_t time = kStartMs;
  float value = -90.0F;
  const std::size_t allocatedBefore = allocations.load();
  for (auto _ : state) {
    ring.append(time, value);
    time += 480;
    value = value < -60.0F ? value + 0.5F : -120.0F;
    benchmark::ClobberMemory();
  }
  state.counters["allocations"] = static_cast<double>(allocations.load() - allocatedBefore);
  state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_Append);

// An hour of samples every 480 ms, the fastest series, read into columns from an hour ago.
void BM_HourOfOneSeries(benchmark::State& state) {
  series::SampleRing ring(series::SeriesStore::kCapacity);
  constexpr std::int64_t kPeriodMs = 480;
  constexpr std::int64_t kHourMs = 3'600'000;
  const std::int64_t samples = kHourMs / kPeriodMs;
  for (std::int64_t i = 0; i < samples; ++i)
    ring.append(kStartMs + i * kPeriodMs, -90.0F + static_cast<float>(i % 40));
  const std::int64_t now = kStartMs + kHourMs;
  std::vector<std::int64_t> times;
  std::vector<double> values;
  for (auto _ : state) {
    const series::SampleRange range = ring.since(now - kHourMs);
    times.clear();
    values.clear();
    for (const series::Sample sample : range) {
      times.push_back(sample.timeMs);
      values.push_back(sample.value);
    }
    benchmark::DoNotOptimize(times.data());
    benchmark::DoNotOptimize(values.data());
  }
  state.counters["samples"] = static_cast<double>(times.size());
}
BENCHMARK(BM_HourOfOneSeries)->Unit(benchmark::kMicrosecond);

}  // namespace

BENCHMARK_MAIN();
