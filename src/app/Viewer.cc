#include "app/Viewer.h"

#include <iostream>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>

#include "app/AppDelegate.h"
#include "app/MainInterface.h"
#include "app/PageChrome.h"
#include "app/RecordClock.h"
#include "app/ReplayControls.h"
#include "app/ServiceOption.h"
#include "app/ViewerAlerts.h"
#include "app/ViewerEvents.h"
#include "platform/CommandLine.h"
#include "platform/Json.h"
#include "platform/ParseNumber.h"
#include "player/Drive.h"
#include "series/SeriesStore.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/sim/SimulatorSource.h"
#include "ui/Application.h"
#include "ui/web/ListenAddress.h"

namespace app {

const std::string_view kViewerUsage =
    "usage: norvo [--listen ADDR:PORT] [--service WHERE]\n"
    "             [--replay LOG.jsonl [--speed X] [--loop]] [--alerts FILE]\n"
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
    "                      that do not parse are reported and skipped. Every page gets a\n"
    "                      player bar to play, pause, change speed and seek\n"
    "  --speed X           replay X times as fast as recorded (default 1), or \"max\" for\n"
    "                      no pauses at all\n"
    "  --loop              start the log over after its last metric\n"
    "  --alerts FILE       the alerts to watch for (TOML, see docs/events.md); without it,\n"
    "                      ~/.config/norvo/alerts.toml if it exists, else the built-in ones\n"
    "  --help              show this text\n"
    "\n"
    "Every screen has an address made of the rows tapped to reach it, such as\n"
    "/LTE/CA%20Status; /api/screens/LTE/CA%20Status answers its table as JSON and\n"
    "/api/store answers the whole store. /timeline lists what happened: RRC changes,\n"
    "handovers, radio link failures, registrations, carriers, bearers (/api/events).\n";

namespace {

struct ViewerOptions {
  ui::DisplayOptions display;
  ServiceChoice service;
  std::optional<std::string> alertsPath;
  std::optional<std::string> replayPath;
  std::optional<double> replaySpeed = 1.0;  // empty: as fast as the intake takes the metrics
  bool loop = false;
};

std::nullopt_t refuse(std::string_view why) {
  std::cerr << "norvo: " << why << '\n';
  return std::nullopt;
}

// Empty, after saying why on standard error, when the arguments make no sense.
std::optional<ViewerOptions> parseOptions(std::span<const std::string_view> arguments) {
  std::optional<std::string_view> listen, service, replay, speed, alerts;
  bool loop = false;
  const platform::CommandLineOption table[] = {
      {"--listen", &listen, "an address and a port"},
      {"--service", &service},
      {"--replay", &replay, "a metric log"},
      {"--speed", &speed},
      {"--loop", &loop},
      {"--alerts", &alerts, "an alerts file"},
  };
  if (const std::string error = platform::readCommandLine(arguments, table); !error.empty()) {
    std::cerr << "norvo: " << error << "\n\n" << kViewerUsage;
    return std::nullopt;
  }

  ViewerOptions options;
  if (listen) {
    const auto endpoint = ui::web::parseListenAddress(*listen);
    if (!endpoint) return refuse("--listen wants an address and a port, such as 127.0.0.1:8080");
    options.display.listen = *endpoint;
  }
  if (service) {
    const auto choice = parseServiceChoice(*service);
    if (!choice) return refuse("--service wants builtin, dbus, dbus:system or dbus:ADDRESS");
    options.service = *choice;
  }
  if (speed == "max") {
    options.replaySpeed = std::nullopt;
  } else if (speed) {
    options.replaySpeed = platform::parseSpeedFactor(*speed);
    if (!options.replaySpeed) return refuse("--speed wants a number above 0 or \"max\"");
  }
  options.loop = loop;
  if (replay && options.service.bus) {
    return refuse(
        "--replay goes with the built-in service; on D-Bus, run\n"
        "       tarnd --source replay:LOG.jsonl");
  }
  if ((speed || loop) && !replay) return refuse("--speed and --loop go with --replay");
  if (replay) options.replayPath = std::string(*replay);
  if (alerts) options.alertsPath = std::string(*alerts);
  return options;
}

// The metrics of the service inside Norvo: the simulated phone. The same drive every run, so
// that what one user sees another can reproduce.
std::shared_ptr<tarn::service::MetricSource> simulatedPhone() {
  constexpr std::uint64_t kDriveSeed = 1;
  return std::make_shared<tarn::sim::SimulatorSource>(kDriveSeed);
}

}  // namespace

int runViewer(std::span<const std::string_view> arguments) {
  if (platform::asksForHelp(arguments)) {
    std::cout << kViewerUsage;
    return 0;
  }
  std::optional<ViewerOptions> options = parseOptions(arguments);
  if (!options) return 2;

  // A replay plays on the main queue, so that it can seek; the service then has no source. On a
  // bus, tarnd brings its own.
  std::shared_ptr<tarn::service::MetricSource> source;
  std::optional<player::Drive> drive;
  try {
    if (options->replayPath) {
      drive = player::readDrive(*options->replayPath, std::cerr);
    } else if (!options->service.bus) {
      source = simulatedPhone();
    }
  } catch (const std::runtime_error& error) {
    std::cerr << "norvo: " << error.what() << '\n';
    return 1;
  }
  useService(options->service, std::move(source));

  ui::DisplayOptions display = std::move(options->display);
  store::MetricValidator& intake = store::MetricValidator::sharedInstance();
  display.readings.emplace("store",
                           [&intake] { return platform::toJson(store::dumpStore(intake)); });
  ViewerEvents events(intake);
  events.addPages(display);
  RecordClock recordTime(intake);
  series::SeriesStore levels([&recordTime] { return recordTime.nowMs(); });
  intake.addStoreObserver(
      [&levels](store::DisplayDictionary replaced, const store::MetricValidator& converted) {
        levels.storeDidUpdate(replaced, converted);
      });
  ViewerAlerts alerts(
      viewerAlertRules(options->alertsPath),
      [&levels](std::string_view name) -> std::optional<alerts::Reading> {
        const auto latest = levels.latest(name);
        if (!latest) return std::nullopt;
        return alerts::Reading{latest->timeMs, latest->value};
      },
      intake, recordTime, events.ring(), !drive.has_value());
  std::optional<ReplayControls> replay;
  if (drive) {
    replay.emplace(std::move(*drive), options->replaySpeed, options->loop, intake, [&] {
      intake.clearStore();
      events.reset();
      recordTime.reset();
      levels.clear();
      alerts.reset();
    });
    replay->addPages(display);
    replay->start();
  }
  PageChrome chrome;
  chrome.activeAlerts = [&alerts] { return alerts.active(); };
  if (replay) chrome.replayState = [&replay] { return replay->stateDictionary(); };
  chrome.addReading(display);
  AppDelegate delegate;
  return ui::applicationMain(delegate, mainInterface(), std::move(display));
}

}  // namespace app
