// norvo-fleet-sim: many simulated phones in one process, each publishing to a broker as
// `tarnd --bus none --publish` would, for trying out and measuring a fleet without the phones.
#include <signal.h>

#include <iostream>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/CommandLine.h"
#include "platform/Format.h"
#include "platform/ParseNumber.h"
#include "tarn/mqtt/Publisher.h"
#include "tarn/mqtt/PublishingSource.h"
#include "tarn/sim/SimulatorSource.h"

namespace {

constexpr std::string_view kUsage =
    "usage: norvo-fleet-sim --publish mqtt[s]://[USER[:PASS]@]HOST[:PORT]/PREFIX\n"
    "                       [--devices N] [--speed X] [--qos 0|1] [--mqtt-ca FILE]\n"
    "\n"
    "Runs N simulated phones (default 10), sim-001 to sim-N with seeds 1 to N, at X times real\n"
    "time (default 1, about 5.5 metrics a second each), each publishing to PREFIX/sim-NNN as\n"
    "tarnd --publish does, until SIGINT or SIGTERM.\n";

constexpr std::size_t kQueueLimit = 4000;

struct Device {
  std::unique_ptr<tarn::mqtt::Publisher> publisher;
  std::shared_ptr<tarn::mqtt::PublishingSource> source;
};

int usageError(std::string_view why) {
  std::cerr << "norvo-fleet-sim: " << why << "\n\n" << kUsage;
  return 2;
}

}  // namespace

int main(int argc, char** argv) {
  sigset_t stopSignals;
  sigemptyset(&stopSignals);
  sigaddset(&stopSignals, SIGINT);
  sigaddset(&stopSignals, SIGTERM);
  pthread_sigmask(SIG_BLOCK, &stopSignals, nullptr);

  const std::vector<std::string_view> arguments(argv + 1, argv + argc);
  if (platform::asksForHelp(arguments)) {
    std::cout << kUsage;
    return 0;
  }
  std::optional<std::string_view> publish, devices, speed, qos, caFile;
  const platform::CommandLineOption table[] = {
      {"--publish", &publish, "a broker address"},
      {"--devices", &devices},
      {"--speed", &speed},
      {"--qos", &qos},
      {"--mqtt-ca", &caFile, "a certificate file"},
  };
  if (const std::string error = platform::readCommandLine(arguments, table); !error.empty())
    return usageError(error);
  const auto broker = tarn::mqtt::parseBrokerAddress(publish.value_or(""));
  if (!broker.address) return usageError("--publish: " + broker.error);
  const auto count = platform::parseNumber<unsigned>(devices.value_or("10"));
  if (!count || *count == 0 || *count > 9999) return usageError("--devices wants 1 to 9999");
  const auto factor = platform::parseSpeedFactor(speed.value_or("1"));
  if (!factor) return usageError("--speed wants a number above 0");
  if (qos && *qos != "0" && *qos != "1") return usageError("--qos wants 0 or 1");

  std::vector<Device> fleet(*count);
  try {
    for (unsigned n = 1; n <= *count; ++n) {
      const std::string name = platform::format("sim-%03u", n);
      Device& device = fleet[n - 1];
      device.publisher = std::make_unique<tarn::mqtt::Publisher>(tarn::mqtt::PublisherOptions{
          .broker = *broker.address,
          .caFile = caFile ? std::optional<std::string>(*caFile) : std::nullopt,
          .device = name,
          .qos = qos == "0" ? 0 : 1,
          .queueLimit = kQueueLimit,
          .source = platform::format("sim, seed %u, speed %g", n, *factor),
          .name = "norvo-fleet-sim",
      });
      device.source = std::make_shared<tarn::mqtt::PublishingSource>(
          std::make_shared<tarn::sim::SimulatorSource>(n, *factor), *device.publisher,
          broker.address->path, name);
      device.source->start([](const tarn::service::Metric&) {});
    }
  } catch (const std::exception& error) {
    std::cerr << "norvo-fleet-sim: " << error.what() << '\n';
    return 1;
  }
  std::cout << "norvo-fleet-sim: " << *count << " devices publishing to " << broker.address->shown()
            << std::endl;
  int signal = 0;
  sigwait(&stopSignals, &signal);
  for (Device& device : fleet)
    device.source->stop();
  return 0;
}
