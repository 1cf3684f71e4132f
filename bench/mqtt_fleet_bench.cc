// Metrics over MQTT through a Mosquitto broker of the benchmark's own on a loopback port: what
// publishing costs tarnd, and a fleet of 100 devices at 20 metrics/s each into `norvo --fleet`.
#include <benchmark/benchmark.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <fstream>
#include <map>
#include <mutex>
#include <sstream>
#include <thread>

#include "Broker.h"
#include "ChildProcess.h"
#include "CpuTime.h"
#include "Eventually.h"
#include "TemporaryFolder.h"
#include "fleet/Fleet.h"
#include "platform/Format.h"
#include "tarn/log/MetricLog.h"
#include "tarn/mqtt/Link.h"
#include "tarn/mqtt/Publisher.h"
#include "tarn/mqtt/PublishingSource.h"

namespace {

using namespace std::chrono_literals;
using cputime::cpuSecondsOf;
using cputime::processCpuSeconds;
using cputime::threadCpuSeconds;

// About an encoded LTE serving-cell measurement with its two receive measurements.
const tarn::service::Metric kMetric{0x3CD301, platform::Bytes(48, 0x5A)};

std::int64_t unixMs() {
  return std::chrono::duration_cast<std::chrono::milliseconds>(
             std::chrono::system_clock::now().time_since_epoch())
      .count();
}

tarn::mqtt::PublisherOptions publisherOptions(const mqtttest::Broker& broker, std::string device,
                                              std::size_t queueLimit) {
  return {.broker = *tarn::mqtt::parseBrokerAddress(broker.address("fleet")).address,
          .caFile = std::nullopt,
          .device = std::move(device),
          .qos = 1,
          .queueLimit = queueLimit,
          .source = "bench",
          .name = "bench"};
}

// Bursts of metrics through one publisher at QoS 1, as tarnd's source hands them on: the line
// formatted and queued on the source's thread (`source_us_per_metric`), and everything the
// process spends until the broker has acknowledged them all, the library's network thread
// included (`process_us_per_metric`).
void BM_PublishCpuPerMetric(benchmark::State& state) {
  bustest::TemporaryFolder folder;
  mqtttest::Broker broker(folder.path(), {});
  const auto burst = static_cast<std::size_t>(state.range(0));
  tarn::mqtt::Publisher publisher(publisherOptions(broker, "car-1", burst));
  if (!bustest::eventually([&] { return publisher.counts().linked; }, 5s)) {
    state.SkipWithError("no link to the broker");
    return;
  }
  double sourceSeconds = 0.0, processSeconds = 0.0;
  std::size_t published = 0;
  for (auto _ : state) {
    const std::uint64_t sentBefore = publisher.counts().sent;
    const double processBefore = processCpuSeconds();
    const double threadBefore = threadCpuSeconds();
    for (std::size_t n = 0; n < burst; ++n)
      publisher.publish(
          tarn::mqtt::metricMessage(kMetric, static_cast<std::int64_t>(n), "car-1", unixMs()));
    sourceSeconds += threadCpuSeconds() - threadBefore;
    bustest::eventually([&] { return publisher.counts().sent >= sentBefore + burst; }, 60s);
    processSeconds += processCpuSeconds() - processBefore;
    published += burst;
  }
  state.counters["source_us_per_metric"] = 1e6 * sourceSeconds / static_cast<double>(published);
  state.counters["process_us_per_metric"] = 1e6 * processSeconds / static_cast<double>(published);
  state.counters["dropped"] = static_cast<double>(publisher.counts().dropped);
}
BENCHMARK(BM_PublishCpuPerMetric)
    ->Arg(20'000)
    ->Iterations(5)
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);

// `state.range(0)` devices at `state.range(1)` metrics/s each for 10 s, published from this
// process through the broker to `norvo --fleet` (a process of its own) and to a subscriber here
// that measures the loss and the latency from each message's "unix_ms" to its arrival.
void BM_FleetThroughOneBroker(benchmark::State& state) {
  const auto devices = static_cast<int>(state.range(0));
  const auto rate = static_cast<int>(state.range(1));
  constexpr auto kDuration = 10s;
  bustest::TemporaryFolder folder;
  mqtttest::Broker broker(folder.path(), {});

  for (auto _ : state) {
    bustest::ChildProcess fleet(
        {.arguments = {NORVO_VIEWER, "--fleet", broker.address("fleet"), "--listen", "127.0.0.1:0"},
         .standardOutput = folder / "fleet.out",
         .standardError = folder / "fleet.err",
         .descriptor3 = std::nullopt});
    std::mutex mutex;
    std::vector<std::int64_t> latencies;
    std::map<std::string, std::size_t, std::less<>> received;
    tarn::mqtt::LinkOptions watcher;
    watcher.broker = *tarn::mqtt::parseBrokerAddress(broker.address("fleet")).address;
    watcher.subscriptions = {"fleet/+/metrics"};
    watcher.name = "watcher";
    std::atomic<std::size_t> subscribed = 0;
    tarn::mqtt::Link watch(watcher, {.connected = {},
                                     .disconnected = {},
                                     .published = {},
                                     .message =
                                         [&](std::string_view topic, std::string_view payload) {
                                           const std::int64_t now = unixMs();
                                           const auto line = tarn::log::parseMetricLogLine(payload);
                                           const auto* sent =
                                               line.entry ? line.entry->record.find("unix_ms")
                                                          : nullptr;
                                           const std::lock_guard lock(mutex);
                                           ++received[std::string(topic)];
                                           if (sent != nullptr)
                                             latencies.push_back(now - *sent->asInteger());
                                         },
                                     .subscribed = [&] { ++subscribed; }});
    watch.start();

    std::vector<std::unique_ptr<tarn::mqtt::Publisher>> publishers;
    for (int n = 1; n <= devices; ++n)
      publishers.push_back(std::make_unique<tarn::mqtt::Publisher>(
          publisherOptions(broker, platform::format("sim-%03d", n), 4000)));
    const bool ready = bustest::eventually(
        [&] {
          return subscribed == 1 && std::all_of(publishers.begin(), publishers.end(),
                                                [](const auto& p) { return p->counts().linked; });
        },
        30s);
    if (!ready) {
      state.SkipWithError("the publishers or the watcher did not reach the broker");
      return;
    }
    std::this_thread::sleep_for(1s);  // the fleet viewer subscribes
    const double fleetBefore = cpuSecondsOf(fleet.pid());
    const double processBefore = processCpuSeconds();

    // Every tick, each device whose turn it is publishes one metric: an even spread over time.
    const auto tick = std::chrono::microseconds(1'000'000 / (rate * devices));
    const auto start = std::chrono::steady_clock::now();
    std::size_t published = 0;
    for (auto next = start; next < start + kDuration; next += tick) {
      std::this_thread::sleep_until(next);
      const auto device = published % static_cast<std::size_t>(devices);
      publishers[device]->publish(
          tarn::mqtt::metricMessage(kMetric, static_cast<std::int64_t>(published),
                                    platform::format("sim-%03zu", device + 1), unixMs()));
      ++published;
    }
    const auto total = [&] {
      const std::lock_guard lock(mutex);
      std::size_t sum = 0;
      for (const auto& [topic, count] : received)
        sum += count;
      return sum;
    };
    bustest::eventually([&] { return total() >= published; }, 10s);
    const double seconds =
        std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    const double fleetSeconds = cpuSecondsOf(fleet.pid()) - fleetBefore;
    const double processSeconds = processCpuSeconds() - processBefore;

    std::uint64_t dropped = 0;
    for (const auto& publisher : publishers)
      dropped += publisher->counts().dropped;
    const std::lock_guard lock(mutex);
    std::sort(latencies.begin(), latencies.end());
    const auto percentile = [&](double p) {
      if (latencies.empty()) return -1.0;
      return static_cast<double>(
          latencies[static_cast<std::size_t>(p * static_cast<double>(latencies.size() - 1))]);
    };
    state.counters["published"] = static_cast<double>(published);
    state.counters["lost"] = static_cast<double>(published) - static_cast<double>(latencies.size());
    state.counters["dropped"] = static_cast<double>(dropped);
    state.counters["latency_ms_p50"] = percentile(0.5);
    state.counters["latency_ms_p99"] = percentile(0.99);
    state.counters["latency_ms_max"] = percentile(1.0);
    state.counters["fleet_viewer_cpu_percent_of_core"] = 100.0 * fleetSeconds / seconds;
    state.counters["publishers_us_per_metric"] =
        1e6 * processSeconds / static_cast<double>(published);
    fleet.stop(SIGTERM, 5s);
  }
}
// The second: the largest fleet this process can publish for, at the same total rate. Each
// publisher here is a libmosquitto client with three descriptors, which the library watches with
// select(), so one process holds at most about 330 of them; BM_FleetPage shows the page's side
// for 1,000 devices.
BENCHMARK(BM_FleetThroughOneBroker)
    ->Args({100, 20})
    ->Args({300, 7})
    ->Iterations(1)
    ->UseRealTime()
    ->Unit(benchmark::kSecond);

// The fleet page's side alone, for `state.range(0)` devices: taking in one metric message
// (`receive_us`), and answering /api/fleet (`json_ms`), as norvo --fleet does for each.
void BM_FleetPage(benchmark::State& state) {
  const auto devices = static_cast<int>(state.range(0));
  fleet::Fleet fleet("fleet");
  std::vector<std::string> topics;
  for (int n = 1; n <= devices; ++n)
    topics.push_back(platform::format("fleet/sim-%04d/metrics", n));
  const std::string message = tarn::mqtt::metricMessage(kMetric, 0, "sim", unixMs());
  std::int64_t now = 0;
  std::size_t received = 0;
  double receiveSeconds = 0.0, jsonSeconds = 0.0;
  std::size_t answers = 0;
  for (auto _ : state) {
    const double start = threadCpuSeconds();
    for (const std::string& topic : topics)
      fleet.receive(topic, message, ++now);
    receiveSeconds += threadCpuSeconds() - start;
    received += topics.size();
    const double before = threadCpuSeconds();
    benchmark::DoNotOptimize(fleet.json(now));
    jsonSeconds += threadCpuSeconds() - before;
    ++answers;
  }
  state.counters["receive_us"] = 1e6 * receiveSeconds / static_cast<double>(received);
  state.counters["json_ms"] = 1e3 * jsonSeconds / static_cast<double>(answers);
}
BENCHMARK(BM_FleetPage)->Arg(1000)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
