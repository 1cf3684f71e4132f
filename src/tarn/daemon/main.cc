#include <sdbus-c++/Error.h>
#include <signal.h>
#include <unistd.h>

#include <cstdlib>
#include <exception>
#include <iostream>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Format.h"
#include "tarn/daemon/Options.h"
#include "tarn/daemon/RecordFile.h"
#include "tarn/dbus/Bus.h"
#include "tarn/dbus/Interface.h"
#include "tarn/dbus/Service.h"
#include "tarn/log/RecordingSource.h"
#include "tarn/mm/ModemManagerSource.h"
#include "tarn/mqtt/Publisher.h"
#include "tarn/mqtt/PublishingSource.h"
#include "tarn/replay/ReplaySource.h"
#include "tarn/service/Core.h"
#include "tarn/sim/SimulatorSource.h"

namespace {

using tarn::daemon::DaemonOptions;
using tarn::daemon::ModemManagerChoice;
using tarn::daemon::ReplayChoice;
using tarn::daemon::SimulatorChoice;

constexpr std::string_view kUsage =
    "usage: tarnd [--source sim [--seed N] [--speed X]]\n"
    "       tarnd --source replay:LOG.jsonl [--speed X | --as-fast-as-possible] [--loop]\n"
    "       tarnd --source modemmanager[:MODEM] [--refresh SECONDS]\n"
    "             [--bus session|system|ADDRESS|none] [--record OUT.jsonl]\n"
    "             [--publish mqtt[s]://[USER[:PASS]@]HOST[:PORT]/PREFIX [--mqtt-ca FILE]\n"
    "              [--device ID] [--qos 0|1] [--mqtt-queue N]]\n"
    "\n"
    "Serves the baseband manager service on D-Bus under the name org.norvo.Tarn1 until SIGINT\n"
    "or SIGTERM, and publishes its metrics to an MQTT broker if asked to.\n"
    "\n"
    "options:\n"
    "  --source sim             the simulated phone (the default)\n"
    "  --seed N                 the simulated drive (default 1)\n"
    "  --source replay:LOG.jsonl\n"
    "                           replay a metric log; lines that do not parse are reported and\n"
    "                           skipped\n"
    "  --speed X                run X times as fast as real time, or as recorded (default 1)\n"
    "  --as-fast-as-possible    replay without pauses (also --speed max)\n"
    "  --loop                   start the log over after its last metric\n"
    "  --source modemmanager[:MODEM]\n"
    "                           a real modem through ModemManager on the system bus\n"
    "                           (DBUS_SYSTEM_BUS_ADDRESS points elsewhere): the first modem, or\n"
    "                           the one of this D-Bus path, index or IMEI\n"
    "  --refresh SECONDS        how often to read the modem's signal and cells, 1 to 5\n"
    "                           (default 2)\n"
    "  --bus BUS                session (the default), system, or a D-Bus address such as\n"
    "                           unix:path=/run/user/1000/bus; none only publishes\n"
    "  --record OUT.jsonl       write every metric the source produces to a metric log, with\n"
    "                           \"t_ms\" counted from the start, for --source replay:OUT.jsonl\n"
    "  --publish URL            publish every metric to PREFIX/DEVICE/metrics on the broker,\n"
    "                           and the device's state, retained, to PREFIX/DEVICE/status\n"
    "  --mqtt-ca FILE           the certificate authority of an mqtts:// broker\n"
    "  --device ID              the device's name under PREFIX (default: the host name)\n"
    "  --qos 0|1                the MQTT quality of service of the metrics (default 1)\n"
    "  --mqtt-queue N           metrics held while the broker is away (default 4000, ten\n"
    "                           minutes of the simulated phone); past it the oldest go\n"
    "  --help                   show this text\n";

constexpr int kExitFailure = 1;
constexpr int kExitUsage = 2;

// What requesting a bus name fails with when another connection owns it.
constexpr std::string_view kNameTaken = "org.freedesktop.DBus.Error.FileExists";

std::string describeBus(const std::string& bus) {
  if (bus == "session" || bus == "system") return "the " + bus + " bus";
  return "the bus at " + bus;
}

std::string describeSource(const DaemonOptions& options) {
  std::string text;
  if (const auto* simulator = std::get_if<SimulatorChoice>(&options.source)) {
    text = platform::format("sim, seed %u", simulator->seed);
    if (simulator->speed != 1.0) text += platform::format(", speed %g", simulator->speed);
  } else if (const auto* modem = std::get_if<ModemManagerChoice>(&options.source)) {
    text = "modemmanager, " + (modem->modem.empty() ? "the first modem" : "modem " + modem->modem) +
           platform::format(", every %u s", modem->refresh.count());
  } else {
    const auto& replay = std::get<ReplayChoice>(options.source);
    text = "replay of " + replay.path;
    const std::optional<double> speed = replay.options.speed;
    if (!speed)
      text += ", as fast as possible";
    else if (*speed != 1.0)
      text += platform::format(", speed %g", *speed);
    if (replay.options.loop) text += ", looping";
  }
  if (options.recordPath) text += "; recording to " + *options.recordPath;
  return text;
}

std::shared_ptr<tarn::service::MetricSource> makeSource(const DaemonOptions& options) {
  if (const auto* simulator = std::get_if<SimulatorChoice>(&options.source))
    return std::make_shared<tarn::sim::SimulatorSource>(simulator->seed, simulator->speed);
  if (const auto* modem = std::get_if<ModemManagerChoice>(&options.source)) {
    return std::make_shared<tarn::mm::ModemManagerSource>(
        tarn::mm::ModemManagerOptions{.modem = modem->modem, .refresh = modem->refresh},
        [](const std::string& line) { std::cerr << "tarnd: modemmanager: " << line << std::endl; });
  }
  const auto& replay = std::get<ReplayChoice>(options.source);
  return std::make_shared<tarn::replay::ReplaySource>(replay.path, replay.options, std::cerr);
}

// The host name as one topic level, with what a topic level cannot hold made "_".
std::string hostDevice() {
  char name[256] = {};
  if (gethostname(name, sizeof name - 1) != 0 || name[0] == '\0') return "tarnd";
  std::string device(name);
  for (char& c : device) {
    if (c == '/' || c == '+' || c == '#') c = '_';
  }
  return device;
}

std::unique_ptr<tarn::mqtt::Publisher> startPublisher(const tarn::daemon::PublishChoice& choice,
                                                      const std::string& device,
                                                      const DaemonOptions& options) {
  return std::make_unique<tarn::mqtt::Publisher>(tarn::mqtt::PublisherOptions{
      .broker = choice.broker,
      .caFile = choice.caFile,
      .device = device,
      .qos = choice.qos,
      .queueLimit = choice.queueLimit,
      .source = describeSource(options),
      .name = "tarnd",
  });
}

std::string explainServiceError(const sdbus::Error& error) {
  if (error.getName() == kNameTaken) return "the name is taken (is another tarnd running?)";
  return error.getName() + ": " + error.getMessage();
}

// Why the connection to the bus broke, if it did: set on the bus thread, which then wakes the
// main thread with SIGTERM.
class BusLoss {
 public:
  void report(const std::string& reason) {
    {
      const std::lock_guard lock(mutex_);
      reason_ = reason;
    }
    ::kill(::getpid(), SIGTERM);
  }

  std::optional<std::string> reason() {
    const std::lock_guard lock(mutex_);
    return reason_;
  }

 private:
  std::mutex mutex_;
  std::optional<std::string> reason_;
};

void blockShutdownSignals(sigset_t& signals) {
  sigemptyset(&signals);
  sigaddset(&signals, SIGINT);
  sigaddset(&signals, SIGTERM);
  pthread_sigmask(SIG_BLOCK, &signals, nullptr);
}

int serve(const DaemonOptions& options, const sigset_t& shutdownSignals) {
  std::shared_ptr<tarn::service::MetricSource> source = makeSource(options);
  const bool onBus = options.bus != tarn::daemon::kNoBus;
  const std::string bus = describeBus(options.bus);
  std::unique_ptr<sdbus::IConnection> connection;
  if (onBus) {
    try {
      connection = tarn::dbus::connectToBus(options.bus);
    } catch (const sdbus::Error& error) {
      std::cerr << "tarnd: cannot connect to " << bus << ": " << error.getMessage() << '\n';
      return kExitFailure;
    }
  }
  // Before the service, so that it outlives the source that feeds it.
  std::unique_ptr<tarn::mqtt::Publisher> publisher;
  if (options.publish) {
    const std::string device = options.publish->device.value_or(hostDevice());
    std::cout << "tarnd: publishing to " << options.publish->broker.shown() << " as " << device
              << std::endl;
    try {
      publisher = startPublisher(*options.publish, device, options);
    } catch (const std::runtime_error& error) {
      std::cerr << "tarnd: cannot publish to " << options.publish->broker.shown() << ": "
                << error.what() << '\n';
      return kExitFailure;
    }
    source = std::make_shared<tarn::mqtt::PublishingSource>(std::move(source), *publisher,
                                                            options.publish->broker.path, device);
  }
  // Opened once the bus is reached, so that a daemon that cannot start leaves an earlier recording
  // alone; two daemons recording to one file are kept apart by its lock.
  std::optional<tarn::daemon::RecordFile> record;
  if (options.recordPath) {
    record.emplace(*options.recordPath);
    source = std::make_shared<tarn::log::RecordingSource>(std::move(source), record->stream(),
                                                          *options.recordPath);
  }

  BusLoss busLoss;
  std::optional<std::string> lostBecause;
  if (onBus) {
    auto core = std::make_shared<tarn::service::Core>(std::move(source));
    std::optional<tarn::dbus::Service> service;
    try {
      service.emplace(core, std::move(connection),
                      [&busLoss](const std::string& reason) { busLoss.report(reason); });
    } catch (const sdbus::Error& error) {
      std::cerr << "tarnd: cannot serve " << tarn::dbus::kBusName << " on " << bus << ": "
                << explainServiceError(error) << '\n';
      return kExitFailure;
    }
    std::cout << "tarnd: serving " << tarn::dbus::kBusName << " on " << bus
              << " (source: " << describeSource(options) << ")" << std::endl;

    int signal = 0;
    sigwait(&shutdownSignals, &signal);
    lostBecause = busLoss.reason();
  } else {
    // Nobody listens here, so a replay starts at once.
    source->start([](const tarn::service::Metric&) {});
    std::cout << "tarnd: serving no bus (source: " << describeSource(options) << ")" << std::endl;
    int signal = 0;
    sigwait(&shutdownSignals, &signal);
    source->stop();
  }
  // The service and its source have stopped: the log is complete.
  if (record && !record->close()) {
    std::cerr << "tarnd: could not write all of " << *options.recordPath << '\n';
    return kExitFailure;
  }
  if (lostBecause) {
    std::cerr << "tarnd: lost the connection to " << bus << ": " << *lostBecause << '\n';
    return kExitFailure;
  }
  return EXIT_SUCCESS;
}

}  // namespace

int main(int argc, char** argv) {
  // Before any thread starts, so that every thread inherits the mask and only sigwait sees them.
  sigset_t shutdownSignals;
  blockShutdownSignals(shutdownSignals);

  const std::vector<std::string_view> arguments(argv + 1, argv + argc);
  const tarn::daemon::ParsedOptions parsed = tarn::daemon::parseDaemonOptions(arguments);
  if (!parsed.options) {
    std::cerr << "tarnd: " << parsed.error << "\n\n" << kUsage;
    return kExitUsage;
  }
  if (parsed.options->help) {
    std::cout << kUsage;
    return EXIT_SUCCESS;
  }
  try {
    return serve(*parsed.options, shutdownSignals);
  } catch (const std::exception& error) {
    std::cerr << "tarnd: " << error.what() << '\n';
    return kExitFailure;
  }
}
