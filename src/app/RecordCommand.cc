#include "app/RecordCommand.h"

#include <boost/asio/signal_set.hpp>
#include <boost/asio/steady_timer.hpp>
#include <csignal>
#include <fstream>
#include <iostream>

#include "app/RootNavigationController.h"
#include "client/TarnWrapper.h"
#include "platform/MainQueue.h"
#include "platform/ParseNumber.h"
#include "tarn/sim/SimulatorSource.h"
#include "ui/Bundle.h"

namespace app {

namespace {

constexpr std::string_view kUsage =
    "usage: norvo record OUT.jsonl [--seconds N] [--seed S] [--speed X] [--service WHERE]\n"
    "\n"
    "Runs the simulated phone, subscribes to its metrics as the viewer does and writes every\n"
    "metric delivered to OUT.jsonl as a metric log, with \"t_ms\" counted from the start, until N\n"
    "seconds have passed or Ctrl-C. --seed chooses the drive (default 1, the viewer's), --speed\n"
    "runs it X times as fast as real time (default 1). norvo --replay OUT.jsonl plays it back.\n"
    "--service dbus (or dbus:system, dbus:ADDRESS) records what tarnd delivers instead.\n";

struct Options {
  std::string outPath;
  RecordingRun run;
};

// Empty, after saying why on standard error, when the arguments make no sense.
std::optional<Options> parseOptions(std::span<const std::string_view> arguments) {
  Options options;
  bool haveOut = false;
  bool simulatorTuned = false;  // --seed or --speed given
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    const std::string_view argument = arguments[i];
    const bool takesValue = argument == "--seconds" || argument == "--seed" ||
                            argument == "--speed" || argument == "--service";
    if (takesValue && i + 1 == arguments.size()) {
      std::cerr << "norvo record: " << argument << " needs a value\n";
      return std::nullopt;
    }
    if (argument == "--seconds") {
      const auto seconds = platform::parseNumber<std::uint32_t>(arguments[++i]);
      if (!seconds || *seconds == 0) {
        std::cerr << "norvo record: --seconds wants a whole number above 0\n";
        return std::nullopt;
      }
      options.run.duration = std::chrono::seconds(*seconds);
    } else if (argument == "--seed") {
      const auto seed = platform::parseNumber<std::uint64_t>(arguments[++i]);
      if (!seed) {
        std::cerr << "norvo record: --seed wants a whole number of at least 0\n";
        return std::nullopt;
      }
      options.run.seed = *seed;
      simulatorTuned = true;
    } else if (argument == "--speed") {
      const auto speed = platform::parseSpeedFactor(arguments[++i]);
      if (!speed) {
        std::cerr << "norvo record: --speed wants a number above 0\n";
        return std::nullopt;
      }
      options.run.speed = *speed;
      simulatorTuned = true;
    } else if (argument == "--service") {
      const auto service = parseServiceChoice(arguments[++i]);
      if (!service) {
        std::cerr << "norvo record: --service wants builtin, dbus, dbus:system or dbus:ADDRESS\n";
        return std::nullopt;
      }
      options.run.service = *service;
    } else if (argument.size() > 1 && argument.front() == '-') {
      std::cerr << "norvo record: unknown option " << argument << '\n';
      return std::nullopt;
    } else if (haveOut) {
      std::cerr << "norvo record: one metric log at a time, not also " << argument << '\n';
      return std::nullopt;
    } else {
      options.outPath = std::string(argument);
      haveOut = true;
    }
  }
  if (!haveOut) {
    std::cerr << "norvo record: which file should the metric log go to?\n";
    return std::nullopt;
  }
  if (simulatorTuned && options.run.service.bus) {
    std::cerr << "norvo record: --seed and --speed tune the simulator inside Norvo; tarnd takes "
                 "its own\n";
    return std::nullopt;
  }
  return options;
}

}  // namespace

void MetricRecorder::metricsDidUpdate(const platform::Dictionary& metric) {
  const auto sinceStart = std::chrono::duration_cast<std::chrono::milliseconds>(
      std::chrono::steady_clock::now() - began_);
  writer_.write(metric, sinceStart.count());
  if (next_ != nullptr) next_->metricsDidUpdate(metric);
}

bool runRecordingSession(const RecordingRun& run, const std::string& configurationPath,
                         std::shared_ptr<TarnWrapperDelegate> receiver) {
  useService(run.service, run.service.bus
                              ? nullptr
                              : std::make_shared<tarn::sim::SimulatorSource>(run.seed, run.speed));
  bool subscribed = false;
  {
    TarnWrapper session;
    session.setDelegate(receiver);
    subscribed = session.addVelaConfigForAppId("vexmora", configurationPath);
    if (subscribed) {
      session.listen();
      session.querySpecificMetric("vexmora", RootNavigationController::kSimQueryTriggerRef, 0,
                                  RootNavigationController::kSimQueryTriggerID, 0, 0);

      boost::asio::steady_timer timer(platform::mainQueue());
      if (run.duration) {
        timer.expires_after(*run.duration);
        timer.async_wait([](const boost::system::error_code& error) {
          if (!error) platform::stopMainQueue();
        });
      }
      boost::asio::signal_set signals(platform::mainQueue(), SIGINT, SIGTERM);
      signals.async_wait([](const boost::system::error_code& error, int) {
        if (!error) platform::stopMainQueue();
      });
      platform::runMainQueue();
    }
  }
  // The session is closed; a service without source stops the simulator.
  useService(ServiceChoice{}, nullptr);
  return subscribed;
}

int runRecordCommand(std::span<const std::string_view> arguments) {
  for (const std::string_view argument : arguments) {
    if (argument == "--help" || argument == "-h") {
      std::cout << kUsage;
      return 0;
    }
  }
  const std::optional<Options> options = parseOptions(arguments);
  if (!options) {
    std::cerr << kUsage;
    return 2;
  }
  const auto configuration =
      ui::Bundle::mainBundle().pathForResource("fen_test_lte", "deviceconfig");
  if (!configuration) {
    std::cerr << "norvo record: cannot find the metric configuration among the resources\n";
    return 1;
  }
  std::ofstream out(options->outPath, std::ios::binary | std::ios::trunc);
  if (!out) {
    std::cerr << "norvo record: cannot write " << options->outPath << '\n';
    return 1;
  }
  if (!runRecordingSession(options->run, *configuration, std::make_shared<MetricRecorder>(out))) {
    std::cerr << "norvo record: the service refused the metric configuration\n";
    return 1;
  }
  out.close();
  if (out.fail()) {
    std::cerr << "norvo record: cannot write " << options->outPath << '\n';
    return 1;
  }
  return 0;
}

}  // namespace app
