#include "app/Viewer.h"

#include <iostream>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>

#include "app/AppDelegate.h"
#include "app/MainInterface.h"
#include "app/ServiceOption.h"
#include "platform/Json.h"
#include "platform/ParseNumber.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/replay/ReplaySource.h"
#include "tarn/sim/SimulatorSource.h"
#include "ui/Application.h"
#include "ui/web/ListenAddress.h"

namespace app {

const std::string_view kViewerUsage =
    "usage: norvo [--listen ADDR:PORT] [--service WHERE]\n"
    "             [--replay LOG.jsonl [--speed X] [--loop]]\n"
    "\n"
    "Shows live baseband state in a web browser: LTE, UMTS and GSM radio state, serving and\n"
    "neighbour cells, carrier aggregation, NAS state, bearers and SIM files. The metrics come\n"
    "from the simulated phone of the baseband service built into Norvo, from a metric log, or\n"
    "from tarnd, the baseband service on D-Bus.\n"
    "\n"
    "options:\n"
    "  --listen ADDR:PORT  where to serve the pages (default 127.0.0.1:8080). Only loopback\n"
    "                      addresses are private; 0.0.0.0:8080 shows the pages to the whole\n"
    "                      network. Port 0 takes any free port.\n"
    "  --service WHERE     the baseband service: \"builtin\" (the default) runs it inside\n"
    "                      Norvo; \"dbus\" reaches tarnd on the session bus, \"dbus:system\"\n"
    "                      or \"dbus:ADDRESS\" on another bus\n"
    "  --replay LOG.jsonl  replay a metric log (see norvo record) instead of simulating; lines\n"
    "                      that do not parse are reported and skipped\n"
    "  --speed X           replay X times as fast as recorded (default 1), or \"max\" for\n"
    "                      no pauses at all\n"
    "  --loop              start the log over after its last metric\n"
    "  --help              show this text\n"
    "\n"
    "Every screen has an address made of the rows tapped to reach it, such as\n"
    "/LTE/CA%20Status; /api/screens/LTE/CA%20Status answers its table as JSON and\n"
    "/api/store answers the whole store.\n";

namespace {

struct ViewerOptions {
  ui::DisplayOptions display;
  ServiceChoice service;
  std::optional<std::string> replayPath;
  tarn::replay::ReplayOptions replay;
  bool replayTuned = false;  // --speed or --loop given
};

// Empty, after saying why on standard error, when the arguments make no sense.
std::optional<ViewerOptions> parseOptions(std::span<const std::string_view> arguments) {
  ViewerOptions options;
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    const std::string_view argument = arguments[i];
    const std::optional<std::string_view> value =
        i + 1 < arguments.size() ? std::optional(arguments[i + 1]) : std::nullopt;
    if (argument == "--listen") {
      const auto endpoint = value ? ui::web::parseListenAddress(*value) : std::nullopt;
      if (!endpoint) {
        std::cerr << "norvo: --listen wants an address and a port, such as 127.0.0.1:8080\n";
        return std::nullopt;
      }
      options.display.listen = *endpoint;
      ++i;
    } else if (argument == "--service") {
      const auto service = value ? parseServiceChoice(*value) : std::nullopt;
      if (!service) {
        std::cerr << "norvo: --service wants builtin, dbus, dbus:system or dbus:ADDRESS\n";
        return std::nullopt;
      }
      options.service = *service;
      ++i;
    } else if (argument == "--replay") {
      if (!value) {
        std::cerr << "norvo: --replay needs a metric log\n";
        return std::nullopt;
      }
      options.replayPath = std::string(*value);
      ++i;
    } else if (argument == "--speed") {
      const bool asFastAsPossible = value == "max";
      const auto speed =
          value && !asFastAsPossible ? platform::parseSpeedFactor(*value) : std::nullopt;
      if (!speed && !asFastAsPossible) {
        std::cerr << "norvo: --speed wants a number above 0 or \"max\"\n";
        return std::nullopt;
      }
      options.replay.speed = speed;
      options.replayTuned = true;
      ++i;
    } else if (argument == "--loop") {
      options.replay.loop = true;
      options.replayTuned = true;
    } else {
      std::cerr << "norvo: unknown option " << argument << "\n\n" << kViewerUsage;
      return std::nullopt;
    }
  }
  if (options.replayPath && options.service.bus) {
    std::cerr << "norvo: --replay goes with the built-in service; on D-Bus, run\n"
                 "       tarnd --source replay:LOG.jsonl\n";
    return std::nullopt;
  }
  if (options.replayTuned && !options.replayPath) {
    std::cerr << "norvo: --speed and --loop go with --replay\n";
    return std::nullopt;
  }
  return options;
}

// The metrics of the service inside Norvo: a replayed log, or the simulated phone.
std::shared_ptr<tarn::service::MetricSource> builtInSource(const ViewerOptions& options) {
  if (options.replayPath) {
    return std::make_shared<tarn::replay::ReplaySource>(*options.replayPath, options.replay,
                                                        std::cerr);
  }
  // The same drive every run, so that what one user sees another can reproduce.
  constexpr std::uint64_t kDriveSeed = 1;
  return std::make_shared<tarn::sim::SimulatorSource>(kDriveSeed);
}

}  // namespace

int runViewer(std::span<const std::string_view> arguments) {
  std::optional<ViewerOptions> options = parseOptions(arguments);
  if (!options) return 2;

  std::shared_ptr<tarn::service::MetricSource> source;
  if (!options->service.bus) {  // on a bus, tarnd brings its own
    try {
      source = builtInSource(*options);
    } catch (const std::runtime_error& error) {
      std::cerr << "norvo: " << error.what() << '\n';
      return 1;
    }
  }
  useService(options->service, std::move(source));

  ui::DisplayOptions display = std::move(options->display);
  display.readings.emplace("store", [] {
    return platform::toJson(store::dumpStore(store::MetricValidator::sharedInstance()));
  });
  AppDelegate delegate;
  return ui::applicationMain(delegate, mainInterface(), std::move(display));
}

}  // namespace app
