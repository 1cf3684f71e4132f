// Delivery of metrics over D-Bus: the service on one bus connection, the app's session on another,
// a dbus-daemon of the benchmark's own between them. And the viewer as the user runs it: norvo
// with tarnd and its simulated phone, each a process of its own, measured from outside.
#include <signal.h>

#include <fstream>
#include <sstream>
#include <string>

#include "ChildProcess.h"
#include "CpuTime.h"
#include "DeliveryPipeline.h"
#include "PrivateBus.h"
#include "Tarnd.h"
#include "TemporaryFolder.h"
#include "tarn/dbus/Bus.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/dbus/Service.h"

namespace {

using cputime::cpuSecondsOf;
using cputime::statusMebibytes;
using delivery::BM_DeliveryLatencyAt1000PerSecond;
using delivery::BM_DeliveryThroughput;

struct BusPath {
  bustest::PrivateBus bus;
  std::unique_ptr<tarn::dbus::Service> service;
  delivery::Pipeline pipeline{[this](std::shared_ptr<tarn::service::Core> core) {
    service = std::make_unique<tarn::dbus::Service>(std::move(core),
                                                    tarn::dbus::connectToBus(bus.address()));
    return std::make_shared<tarn::dbus::BusTransport>(bus.address());
  }};
};

std::size_t linesSaying(const std::filesystem::path& path, std::string_view text) {
  std::ifstream file(path);
  std::size_t count = 0;
  for (std::string line; std::getline(file, line);) {
    if (line == text) ++count;
  }
  return count;
}

// norvo --service dbus:ADDRESS beside tarnd --source sim at the simulator's own pace, for
// `state.range(0)` seconds after a few to settle. Norvo's share of one core and its memory.
void BM_ViewerWithTarnd(benchmark::State& state) {
  const auto seconds = std::chrono::seconds(state.range(0));
  for (auto _ : state) {
    bustest::TemporaryFolder folder;
    bustest::PrivateBus bus;
    const auto tarnd = bustest::startTarnd(bus.address(), {"--source", "sim"}, folder / "tarnd");
    if (!bus.waitForName("org.norvo.Tarn1", true)) {
      state.SkipWithError("tarnd did not come on the bus");
      return;
    }
    bustest::ChildProcess norvo(bustest::ChildProcess::Options{
        .arguments = {NORVO_VIEWER, "--service", "dbus:" + bus.address(), "--listen",
                      "127.0.0.1:0"},
        .standardOutput = folder / "norvo.out",
        .standardError = folder / "norvo.err",
        .descriptor3 = std::nullopt,
    });
    std::this_thread::sleep_for(std::chrono::seconds(3));
    const double cpuBefore = cpuSecondsOf(norvo.pid());
    std::this_thread::sleep_for(seconds);
    const double cpuSeconds = cpuSecondsOf(norvo.pid()) - cpuBefore;
    state.counters["norvo_cpu_percent_of_core"] =
        100.0 * cpuSeconds / static_cast<double>(seconds.count());
    state.counters["norvo_rss_mib"] = statusMebibytes(norvo.pid(), "VmRSS");
    state.counters["norvo_peak_rss_mib"] = statusMebibytes(norvo.pid(), "VmHWM");
    state.counters["tarnd_cpu_percent_of_core"] =
        100.0 * cpuSecondsOf(tarnd->pid()) / static_cast<double>(seconds.count() + 3);
    norvo.stop(SIGTERM, std::chrono::seconds(5));
    tarnd->stop(SIGTERM, std::chrono::seconds(5));
    // What the viewer took in, so that the figures are known to be of a working viewer.
    state.counters["norvo_metrics_taken_in"] =
        static_cast<double>(linesSaying(folder / "norvo.out", "Received Valid Metric"));
  }
}

}  // namespace

BENCHMARK_TEMPLATE(BM_DeliveryThroughput, BusPath)
    ->Arg(20000)
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK_TEMPLATE(BM_DeliveryLatencyAt1000PerSecond, BusPath)
    ->Arg(5000)
    ->Iterations(1)
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ViewerWithTarnd)->Arg(20)->Iterations(1)->UseRealTime()->Unit(benchmark::kSecond);

BENCHMARK_MAIN();
