#include "app/Viewer.h"

#include <algorithm>
#include <cctype>
#include <fstream>
#include <iostream>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>

#include "app/AppDelegate.h"
#include "app/Dashboard.h"
#include "app/MainInterface.h"
#include "app/PageChrome.h"
#include "app/RecordClock.h"
#include "app/ReplayControls.h"
#include "app/ServiceOption.h"
#include "app/SharedIntake.h"
#include "app/ViewerAlerts.h"
#include "app/ViewerEvents.h"
#include "app/ViewerOutput.h"
#include "platform/CommandLine.h"
#include "platform/Format.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/ParseNumber.h"
#include "player/Drive.h"
#include "series/SeriesStore.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/client/Drops.h"
#include "tarn/flow/DropTally.h"
#include "tarn/mm/ModemManagerSource.h"
#include "tarn/mm/SourceOption.h"
#include "tarn/sim/SimulatorSource.h"
#include "ui/Application.h"
#include "ui/web/Access.h"
#include "ui/web/ListenAddress.h"

namespace app {

const std::string_view kViewerUsage =
    "usage: norvo [--listen ADDR:PORT [--token-file FILE | --no-auth]]\n"
    "             [--tls-cert FILE --tls-key FILE] [--service WHERE]\n"
    "             [--log FILE] [--replay LOG.jsonl [--speed X] [--loop]] [--alerts FILE]\n"
    "             [--source modemmanager[:MODEM] [--refresh SECONDS]]\n"
    "\n"
    "Shows live baseband state in a web browser: LTE, UMTS and GSM radio state, serving and\n"
    "neighbour cells, carrier aggregation, NAS state, bearers and SIM files. The metrics come\n"
    "from the simulated phone of the baseband service built into Norvo, from a metric log, or\n"
    "from tarnd, the baseband service on D-Bus.\n"
    "\n"
    "options:\n"
    "  --listen ADDR:PORT  where to serve the pages (default 127.0.0.1:8080). Only loopback\n"
    "                      addresses are private; 0.0.0.0:8080 shows the pages to the whole\n"
    "                      network, to those who hold its access token: Norvo makes one\n"
    "                      at start and prints the address with it. Port 0 takes any\n"
    "                      free port.\n"
    "  --token-file FILE   the access token to ask for, from FILE, instead of a new one\n"
    "  --no-auth           show the pages beyond loopback to anyone, with no token\n"
    "  --tls-cert FILE     serve the pages over HTTPS with this PEM certificate (its chain\n"
    "                      may follow it) ...\n"
    "  --tls-key FILE      ... and this PEM private key (docs/security.md)\n"
    "  --service WHERE     the baseband service: \"builtin\" (the default) runs it inside\n"
    "                      Norvo; \"dbus\" reaches tarnd on the session bus, \"dbus:system\"\n"
    "                      or \"dbus:ADDRESS\" on another bus;\n"
    "                      mqtt[s]://[USER[:PASS]@]HOST[:PORT]/PREFIX/DEVICE shows a device\n"
    "                      that publishes to a broker (tarnd --publish)\n"
    "  --mqtt-ca FILE      the certificate authority of an mqtts:// broker\n"
    "  --replay LOG.jsonl  replay a metric log (see norvo record) instead of simulating; lines\n"
    "                      that do not parse are reported and skipped. Every page gets a\n"
    "                      player bar to play, pause, change speed and seek\n"
    "  --speed X           replay X times as fast as recorded (default 1), or \"max\" for\n"
    "                      no pauses at all\n"
    "  --loop              start the log over after its last metric\n"
    "  --source modemmanager[:MODEM]\n"
    "                      show a real modem through ModemManager on the system bus: the\n"
    "                      first modem, or the one of this D-Bus path, index or IMEI\n"
    "                      (docs/modemmanager.md)\n"
    "  --refresh SECONDS   how often to read the modem's signal and cells, 1 to 5 (default 2)\n"
    "  --log FILE          write the log lines to FILE; \"-\" writes them to standard output.\n"
    "                      On a terminal, Norvo shows one status line instead, and the lines\n"
    "                      go to $XDG_STATE_HOME/norvo/norvo.log (~/.local/state/norvo/)\n"
    "  --alerts FILE       the alerts to watch for (TOML, see docs/events.md); without it,\n"
    "                      ~/.config/norvo/alerts.toml if it exists, else the built-in ones\n"
    "  --help              show this text\n"
    "\n"
    "Every screen has an address made of the rows tapped to reach it, such as\n"
    "/LTE/CA%20Status; /api/screens/LTE/CA%20Status answers its table as JSON,\n"
    "/api/store answers the whole store and /api/status what was dropped under overload.\n"
    "/dashboard graphs the levels and shows the serving cell; /api/series answers the\n"
    "graphs' series and /api/dashboard the serving cell. /timeline lists what happened:\n"
    "RRC changes, handovers, radio link failures, registrations, carriers, bearers\n"
    "(/api/events).\n";

namespace {

struct ViewerOptions {
  ui::DisplayOptions display;
  ServiceChoice service;
  std::optional<std::string> alertsPath;
  std::optional<std::string> replayPath;
  std::optional<double> replaySpeed = 1.0;  // empty: as fast as the intake takes the metrics
  bool loop = false;
  std::optional<tarn::mm::ModemManagerOptions> modem;
  std::optional<std::string_view> log;
};

std::nullopt_t refuse(std::string_view why) {
  std::cerr << "norvo: " << why << '\n';
  return std::nullopt;
}

// The arguments of the viewer, as given.
struct GivenOptions {
  std::optional<std::string_view> listen, service, replay, speed, source, refresh, log, caFile,
      alerts, tokenFile, tlsCert, tlsKey;
  bool loop = false;
  bool noAuth = false;
};

// Empty, after saying why on standard error, when the values make no sense.
std::optional<ViewerOptions> judgeOptions(const GivenOptions& given) {
  const auto& [listen, service, replay, speed, source, refresh, log, caFile, alerts, tokenFile,
               tlsCert, tlsKey, loop, noAuth] = given;
  ViewerOptions options;
  if (listen) {
    const auto endpoint = ui::web::parseListenAddress(*listen);
    if (!endpoint) return refuse("--listen wants an address and a port, such as 127.0.0.1:8080");
    options.display.listen = *endpoint;
  }
  if (tokenFile && noAuth) return refuse("--token-file and --no-auth exclude each other");
  if (tokenFile) {
    options.display.token = ui::web::Access::readToken(*tokenFile);
    if (!options.display.token) {
      return refuse(
          platform::format("--token-file %s: %s", *tokenFile, ui::web::Access::kTokenFileRule));
    }
  } else if (!options.display.listen.address().is_loopback()) {
    if (noAuth) {
      platform::log::warningf(
          "norvo: --no-auth: anyone who can reach %s sees every page and /api/store (IMSI, "
          "ICCID, IMEI, APNs, addresses)",
          *listen);
    } else {
      try {
        options.display.token = ui::web::Access::makeToken();
      } catch (const std::runtime_error& error) {
        return refuse(error.what());
      }
    }
  }
  try {
    options.display.tls = ui::web::tlsContextOfOptions(tlsCert, tlsKey);
  } catch (const std::runtime_error& error) {
    return refuse(error.what());
  }
  if (service) {
    const auto choice = parseServiceChoice(*service);
    if (!choice) return refuse("--service wants " + std::string(kServiceChoices));
    options.service = *choice;
  }
  if (caFile) {
    if (!options.service.broker || !options.service.broker->tls)
      return refuse("--mqtt-ca goes with an mqtts:// service");
    options.service.caFile = std::string(*caFile);
  }
  if (speed == "max") {
    options.replaySpeed = std::nullopt;
  } else if (speed) {
    options.replaySpeed = platform::parseSpeedFactor(*speed);
    if (!options.replaySpeed) return refuse("--speed wants a number above 0 or \"max\"");
  }
  options.loop = loop;
  if (replay && !options.service.builtIn()) {
    return refuse(
        "--replay goes with the built-in service; elsewhere, run\n"
        "       tarnd --source replay:LOG.jsonl");
  }
  if ((speed || loop) && !replay) return refuse("--speed and --loop go with --replay");
  if (replay) options.replayPath = std::string(*replay);
  if (source && *source != "sim") {
    const std::optional<std::string> modem = tarn::mm::parseModemManagerSource(*source);
    if (!modem) return refuse("--source wants sim or modemmanager[:MODEM]");
    if (replay || options.service.bus) {
      return refuse(
          "--source modemmanager goes with the built-in service and without --replay; on D-Bus, "
          "run\n"
          "       tarnd --source modemmanager");
    }
    options.modem = tarn::mm::ModemManagerOptions{.modem = *modem};
  }
  if (refresh) {
    if (!options.modem) return refuse("--refresh goes with --source modemmanager");
    const std::optional<std::chrono::seconds> seconds = tarn::mm::parseRefresh(*refresh);
    if (!seconds) return refuse(tarn::mm::kRefreshWanted);
    options.modem->refresh = *seconds;
  }
  options.log = log;
  if (alerts) options.alertsPath = std::string(*alerts);
  return options;
}

// The metrics of the service inside Norvo: a modem or the simulated phone.
std::shared_ptr<tarn::service::MetricSource> builtInSource(const ViewerOptions& options) {
  if (options.modem) {
    return std::make_shared<tarn::mm::ModemManagerSource>(
        *options.modem,
        [](const std::string& line) { std::cerr << "norvo: modemmanager: " << line << std::endl; });
  }
  // The same drive every run, so that what one user sees another can reproduce.
  constexpr std::uint64_t kDriveSeed = 1;
  return std::make_shared<tarn::sim::SimulatorSource>(kDriveSeed);
}

// The status line's name for where the metrics come from.
std::string sourceName(const ViewerOptions& options) {
  if (options.service.bus) return "tarnd on D-Bus";
  if (options.replayPath) return "replay of " + *options.replayPath;
  return "simulated phone";
}

// How the viewer keeps up: the events its session dropped because it fell behind, by kind; and,
// with a service on a bus or behind a broker, whether it is reached.
platform::Dictionary viewerStatus(const tarn::client::LinkStatus* link) {
  platform::Dictionary dropped;
  std::uint64_t total = 0;
  for (const auto& [kind, count] : tarn::client::droppedEvents()) {
    dropped.append(tarn::flow::kindName(kind), count);
    total += count;
  }
  platform::Dictionary status = {{"dropped_events", total},
                                 {"dropped_by_kind", std::move(dropped)}};
  if (link) {
    const auto [connected, text] = link->get();
    status.append("service", platform::Dictionary{{"connected", connected}, {"status", text}});
  }
  return status;
}

}  // namespace

int runViewer(std::span<const std::string_view> arguments) {
  GivenOptions given;
  const platform::CommandLineOption table[] = {
      {"--listen", &given.listen, "an address and a port"},
      {"--service", &given.service},
      {"--replay", &given.replay, "a metric log"},
      {"--speed", &given.speed},
      {"--loop", &given.loop},
      {"--source", &given.source},
      {"--refresh", &given.refresh},
      {"--log", &given.log, "a file name, or - for standard output"},
      {"--mqtt-ca", &given.caFile, "a certificate file"},
      {"--alerts", &given.alerts, "an alerts file"},
      {"--token-file", &given.tokenFile, "a file name"},
      {"--no-auth", &given.noAuth},
      {"--tls-cert", &given.tlsCert, "a certificate file"},
      {"--tls-key", &given.tlsKey, "a private key file"},
  };
  if (const auto exit = platform::openCommandLine({"norvo", kViewerUsage}, arguments, table, {},
                                                  std::cout, std::cerr)) {
    return *exit;
  }
  std::optional<ViewerOptions> options = judgeOptions(given);
  if (!options) return 2;

  // A replay plays on the main queue, so that it can seek; the service then has no source.
  // Elsewhere, tarnd or the broker brings its own.
  std::shared_ptr<tarn::service::MetricSource> source;
  std::optional<player::Drive> drive;
  std::shared_ptr<const tarn::client::LinkStatus> link;
  try {
    if (options->replayPath) {
      drive = player::readDrive(*options->replayPath, std::cerr);
    } else if (options->service.builtIn()) {
      source = builtInSource(*options);
    }
    link = useService(options->service, std::move(source));
  } catch (const std::runtime_error& error) {
    std::cerr << "norvo: " << error.what() << '\n';
    return 1;
  }

  store::MetricValidator& intake = sharedIntake();
  RecordClock recordTime(intake);
  series::SeriesStore levels([&recordTime] { return recordTime.nowMs(); });
  const std::unique_ptr<ViewerOutput> output =
      ViewerOutput::open(options->log, sourceName(*options), levels);
  if (!output) return 1;
  output->setLink(link);

  ui::DisplayOptions display = std::move(options->display);
  display.readings.emplace("store",
                           [&intake] { return platform::toJson(store::dumpStore(intake)); });
  addDashboard(display, intake, levels);
  output->wire(display, intake);
  ViewerEvents events(intake);
  events.addPages(display);
  ViewerAlerts alerts(
      viewerAlertRules(options->alertsPath),
      [&levels](std::string_view name) -> std::optional<alerts::Reading> {
        const auto latest = levels.latest(name);
        if (!latest) return std::nullopt;
        return alerts::Reading{latest->timeMs, latest->value};
      },
      intake, recordTime, events.ring(), !drive.has_value());
  output->setAlertCount([&alerts] { return alerts.active().size(); });
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
  display.readings.emplace("status", [link] { return platform::toJson(viewerStatus(link.get())); });
  AppDelegate delegate;
  return ui::applicationMain(delegate, mainInterface(), std::move(display));
}

}  // namespace app
