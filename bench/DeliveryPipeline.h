#pragma once

// The path of a metric from the baseband manager service to the TarnWrapper delegate on the main
// queue, with a source that stamps each metric, and the benchmarks that drive it. A path is a
// type with a `Pipeline pipeline` member, built over the transport it measures.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <ctime>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

#include "client/TarnWrapper.h"
#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "platform/SerialQueue.h"
#include "tarn/client/Transport.h"
#include "tarn/service/Core.h"

namespace delivery {

using Clock = std::chrono::steady_clock;

constexpr std::uint32_t kCaStatus = 0x3CD313;
// About the size of an encoded carrier-aggregation status with two component carriers.
constexpr std::size_t kPayloadSize = 96;

// Emits metrics on its own thread, each stamped with the time it left the source.
class BenchmarkSource final : public tarn::service::MetricSource {
 public:
  void start(std::function<void(tarn::service::Metric)> deliver) override {
    const std::lock_guard lock(mutex_);
    deliver_ = std::move(deliver);
  }
  void stop() override {
    const std::lock_guard lock(mutex_);
    deliver_ = nullptr;
  }
  std::optional<tarn::service::Metric> query(std::uint32_t) override { return {}; }

  // Emits `count` metrics, one every `interval` (zero: as fast as they go).
  void emit(int count, Clock::duration interval) {
    thread_.async([this, count, interval] {
      auto next = Clock::now();
      for (int i = 0; i < count; ++i) {
        if (interval > Clock::duration::zero()) std::this_thread::sleep_until(next += interval);
        const std::lock_guard lock(mutex_);
        if (deliver_) deliver_(stamped());
      }
    });
  }

  static Clock::time_point stampOf(const platform::Bytes& payload) {
    Clock::rep ticks = 0;
    std::memcpy(&ticks, payload.data(), sizeof ticks);
    return Clock::time_point(Clock::duration(ticks));
  }

 private:
  static tarn::service::Metric stamped() {
    tarn::service::Metric metric{kCaStatus, platform::Bytes(kPayloadSize, 0x5A)};
    const Clock::rep ticks = Clock::now().time_since_epoch().count();
    std::memcpy(metric.payload.data(), &ticks, sizeof ticks);
    return metric;
  }

  std::mutex mutex_;
  std::function<void(tarn::service::Metric)> deliver_;
  platform::SerialQueue thread_{"org.norvo.bench.source"};
};

class CountingDelegate final : public TarnWrapperDelegate {
 public:
  explicit CountingDelegate(platform::log::Capture& log) : log_(log) {
    latencies.reserve(std::size_t{1} << 22);
  }

  void metricsDidUpdate(const platform::Dictionary& metric) override {
    const platform::Value* payload = metric.find("kKeyPayload");
    latencies.push_back(Clock::now() - BenchmarkSource::stampOf(*payload->asBytes()));
    // The log lines are kept in memory; dropping them often keeps that memory small and warm.
    if (latencies.size() % 256 == 0) log_.clear();
  }
  void eventsDidUpdate(const platform::Dictionary&) override {}

  std::vector<Clock::duration> latencies;

 private:
  platform::log::Capture& log_;
};

// The service, a wrapper that listens to it with the shipped configuration, and its delegate.
struct Pipeline {
  // Answers the transport by which the wrapper reaches `core`.
  using Reach = std::function<std::shared_ptr<tarn::client::Transport>(
      std::shared_ptr<tarn::service::Core> core)>;

  explicit Pipeline(const Reach& reach) : transport(reach(core)) {
    wrapper = std::make_unique<TarnWrapper>(*transport);
    wrapper->addVelaConfigForAppId("vexmora", NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig");
    wrapper->listen();
    wrapper->setDelegate(delegate);
  }

  // Emits `count` metrics and runs the main queue until the delegate has them all.
  bool deliver(int count, Clock::duration interval) {
    const std::size_t expected = delegate->latencies.size() + static_cast<std::size_t>(count);
    source->emit(count, interval);
    return platform::runMainQueueUntil([&] { return delegate->latencies.size() >= expected; },
                                       std::chrono::seconds(60));
  }

  platform::log::Capture log;
  std::shared_ptr<BenchmarkSource> source = std::make_shared<BenchmarkSource>();
  std::shared_ptr<tarn::service::Core> core = std::make_shared<tarn::service::Core>(source);
  std::shared_ptr<CountingDelegate> delegate = std::make_shared<CountingDelegate>(log);
  std::shared_ptr<tarn::client::Transport> transport;
  std::unique_ptr<TarnWrapper> wrapper;
};

inline double microseconds(Clock::duration duration) {
  return std::chrono::duration<double, std::micro>(duration).count();
}

// CPU time of all the process's threads, so that the cost of a metric can be told apart from
// the time it waits for a core on a busy machine.
inline double processCpuMicroseconds() {
  timespec now{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) * 1e6 + static_cast<double>(now.tv_nsec) / 1e3;
}

template <class Path>
void BM_DeliveryThroughput(benchmark::State& state) {
  const int batch = static_cast<int>(state.range(0));
  Path path;
  Pipeline& pipeline = path.pipeline;
  const double cpuBefore = processCpuMicroseconds();
  for (auto _ : state) {
    if (!pipeline.deliver(batch, Clock::duration::zero())) state.SkipWithError("metrics lost");
  }
  const double metrics = static_cast<double>(state.iterations() * batch);
  state.SetItemsProcessed(state.iterations() * batch);
  state.counters["cpu_us_per_metric"] = (processCpuMicroseconds() - cpuBefore) / metrics;
}

template <class Path>
void BM_DeliveryLatencyAt1000PerSecond(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  Path path;
  Pipeline& pipeline = path.pipeline;
  for (auto _ : state) {
    if (!pipeline.deliver(count, std::chrono::milliseconds(1))) state.SkipWithError("metrics lost");
  }
  std::vector<Clock::duration> latencies = pipeline.delegate->latencies;
  std::sort(latencies.begin(), latencies.end());
  const auto percentile = [&latencies](double fraction) {
    const auto index =
        static_cast<std::size_t>(fraction * static_cast<double>(latencies.size() - 1));
    return microseconds(latencies[index]);
  };
  state.counters["p50_us"] = percentile(0.50);
  state.counters["p99_us"] = percentile(0.99);
  state.counters["max_us"] = microseconds(latencies.back());
}

}  // namespace delivery
