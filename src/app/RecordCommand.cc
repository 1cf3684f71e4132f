#include "app/RecordCommand.h"

#include <boost/asio/signal_set.hpp>
#include <boost/asio/steady_timer.hpp>
#include <csignal>
#include <fstream>
#include <iostream>
#include <stdexcept>

#include "app/RootNavigationController.h"
#include "client/TarnWrapper.h"
#include "platform/CommandLine.h"
#include "platform/Format.h"
#include "platform/MainQueue.h"
#include "platform/ParseNumber.h"
#include "tarn/sim/SimulatorSource.h"
#include "ui/Bundle.h"

namespace app {

namespace {

constexpr std::string_view kUsage =
    "usage: norvo record OUT.jsonl [--to FORMAT] [--seconds N] [--seed S] [--speed X]\n"
    "                              [--service WHERE]\n"
    "\n"
    "Runs the simulated phone, subscribes to its metrics as the viewer does and writes every\n"
    "metric delivered to OUT.jsonl as a metric log, with \"t_ms\" counted from the start, until N\n"
    "seconds have passed or Ctrl-C. --seed chooses the drive (default 1, the viewer's), --speed\n"
    "runs it X times as fast as real time (default 1). norvo --replay OUT.jsonl plays it back.\n"
    "--service dbus (or dbus:system, dbus:ADDRESS) records what tarnd delivers instead, and\n"
    "--service mqtt://HOST/PREFIX/DEVICE what a device publishes to a broker.\n"
    "--to pcapng|jsonl|csv writes the metrics as `norvo export` does instead, as they come; OUT\n"
    "may then be \"-\" for standard output: norvo record --to pcapng - | wireshark -k -i -\n";

struct Options {
  std::string outPath;
  const exporting::ExportFormat* format = nullptr;  // none for a metric log
  RecordingRun run;
};

std::nullopt_t refuse(std::string_view why) {
  std::cerr << "norvo record: " << why << '\n';
  return std::nullopt;
}

// The arguments of the command, as given.
struct GivenOptions {
  std::optional<std::string_view> out, to, seconds, seed, speed, service;
};

// Empty, after saying why on standard error, when the values make no sense.
std::optional<Options> judgeOptions(const GivenOptions& given) {
  const auto& [out, to, seconds, seed, speed, service] = given;
  Options options{.outPath = std::string(*out), .format = nullptr, .run = {}};
  if (to) {
    options.format = exporting::exportFormatNamed(*to);
    if (options.format == nullptr) return refuse("--to wants pcapng, jsonl or csv");
    if (options.format->writesFolder && *out == "-")
      return refuse("--to " + std::string(*to) + " writes one file per record kind: give a folder");
  }
  if (seconds) {
    const auto whole = platform::parseNumber<std::uint32_t>(*seconds);
    if (!whole || *whole == 0) return refuse("--seconds wants a whole number above 0");
    options.run.duration = std::chrono::seconds(*whole);
  }
  if (seed) {
    const auto drive = platform::parseNumber<std::uint64_t>(*seed);
    if (!drive) return refuse("--seed wants a whole number of at least 0");
    options.run.seed = *drive;
  }
  if (speed) {
    const auto factor = platform::parseSpeedFactor(*speed);
    if (!factor) return refuse("--speed wants a number above 0");
    if (*factor > tarn::sim::SimulatorSource::kFastest) {
      return refuse(platform::format("--speed of the simulator is at most %g, not %s",
                                     tarn::sim::SimulatorSource::kFastest, *speed));
    }
    options.run.speed = *factor;
  }
  if (service) {
    const auto choice = parseServiceChoice(*service);
    if (!choice) return refuse("--service wants " + std::string(kServiceChoices));
    options.run.service = *choice;
  }
  if ((seed || speed) && !options.run.service.builtIn())
    return refuse("--seed and --speed tune the simulator inside Norvo; tarnd takes its own");
  return options;
}

int recordExport(const Options& options, const std::string& configuration) {
  std::string error;
  const std::unique_ptr<exporting::MetricExport> out =
      options.format->open(options.outPath, {.raw = false, .live = true}, error);
  if (!out) {
    std::cerr << "norvo record: " << error << '\n';
    return 1;
  }
  const auto exporter = std::make_shared<MetricExporter>(*out);
  const bool subscribed = runRecordingSession(options.run, configuration, exporter);
  const bool finished = out->finish(error);
  if (!subscribed) {
    std::cerr << "norvo record: the service refused the metric configuration\n";
    return 1;
  }
  if (exporter->failed() || !finished) {
    std::cerr << "norvo record: " << (error.empty() ? "cannot write the output" : error) << '\n';
    return 1;
  }
  return 0;
}

}  // namespace

void MetricRecorder::metricsDidUpdate(const platform::Dictionary& metric) {
  const auto sinceStart = std::chrono::duration_cast<std::chrono::milliseconds>(
      std::chrono::steady_clock::now() - began_);
  writer_.write(metric, sinceStart.count());
  if (next_ != nullptr) next_->metricsDidUpdate(metric);
}

void MetricExporter::metricsDidUpdate(const platform::Dictionary& metric) {
  if (failed_) return;
  const auto sinceStart = std::chrono::duration_cast<std::chrono::milliseconds>(
      std::chrono::steady_clock::now() - began_);
  const auto exported = times_.metricOf(metric, sinceStart.count());
  // The service delivers only metrics with an ID and a payload.
  if (const auto* ready = std::get_if<exporting::ExportedMetric>(&exported);
      ready != nullptr && !out_.write(*ready)) {
    failed_ = true;
    platform::stopMainQueue();
  }
}

bool runRecordingSession(const RecordingRun& run, const std::string& configurationPath,
                         const std::shared_ptr<TarnWrapperDelegate>& receiver) {
  useService(run.service, run.service.builtIn()
                              ? std::make_shared<tarn::sim::SimulatorSource>(run.seed, run.speed)
                              : nullptr);
  bool subscribed = false;
  {
    TarnWrapper session;
    session.setDelegate(receiver);
    subscribed = session.addVelaConfigForAppId(TarnWrapper::kAppName, configurationPath);
    if (subscribed) {
      session.listen();
      session.querySpecificMetric(TarnWrapper::kAppName,
                                  RootNavigationController::kSimQueryTriggerRef, 0,
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
  GivenOptions given;
  const platform::CommandLineOption table[] = {
      {"--to", &given.to, "a format: pcapng, jsonl or csv"},
      {"--seconds", &given.seconds},
      {"--seed", &given.seed},
      {"--speed", &given.speed},
      {"--service", &given.service},
  };
  const platform::CommandLinePositional outArgument{&given.out, "metric log",
                                                    "which file should the metric log go to?"};
  if (const auto exit = platform::openCommandLine({"norvo record", kUsage}, arguments, table,
                                                  outArgument, std::cout, std::cerr)) {
    return *exit;
  }
  const std::optional<Options> options = judgeOptions(given);
  if (!options) {
    std::cerr << '\n' << kUsage;
    return 2;
  }
  const auto configuration =
      ui::Bundle::mainBundle().pathForResource("fen_test_lte", "deviceconfig");
  if (!configuration) {
    std::cerr << "norvo record: cannot find the metric configuration among the resources\n";
    return 1;
  }
  if (options->format != nullptr) return recordExport(*options, *configuration);
  std::ofstream out(options->outPath, std::ios::binary | std::ios::trunc);
  if (!out) {
    std::cerr << "norvo record: cannot write " << options->outPath << '\n';
    return 1;
  }
  try {
    if (!runRecordingSession(options->run, *configuration, std::make_shared<MetricRecorder>(out))) {
      std::cerr << "norvo record: the service refused the metric configuration\n";
      return 1;
    }
  } catch (const std::runtime_error& error) {  // an MQTT broker's options that do not work
    std::cerr << "norvo record: " << error.what() << '\n';
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
