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
#include "app/MainInterface.h"
#include "app/ServiceOption.h"
#include "platform/CommandLine.h"
#include "platform/Format.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/ParseNumber.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/client/Drops.h"
#include "tarn/flow/DropTally.h"
#include "tarn/replay/ReplaySource.h"
#include "tarn/sim/SimulatorSource.h"
#include "ui/Application.h"
#include "ui/web/Access.h"
#include "ui/web/ListenAddress.h"

namespace app {

const std::string_view kViewerUsage =
    "usage: norvo [--listen ADDR:PORT [--token-file FILE | --no-auth]] [--service WHERE]\n"
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
    "                      network, to those who hold its access token: Norvo makes one\n"
    "                      at start and prints the address with it. Port 0 takes any\n"
    "                      free port.\n"
    "  --token-file FILE   the access token to ask for, from FILE, instead of a new one\n"
    "  --no-auth           show the pages beyond loopback to anyone, with no token\n"
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
    "/LTE/CA%20Status; /api/screens/LTE/CA%20Status answers its table as JSON,\n"
    "/api/store answers the whole store and /api/status what was dropped under overload.\n";

namespace {

struct ViewerOptions {
  ui::DisplayOptions display;
  ServiceChoice service;
  std::optional<std::string> replayPath;
  tarn::replay::ReplayOptions replay;
};

std::nullopt_t refuse(std::string_view why) {
  std::cerr << "norvo: " << why << '\n';
  return std::nullopt;
}

// The arguments of the viewer, as given.
struct GivenOptions {
  std::optional<std::string_view> listen, service, replay, speed, tokenFile;
  bool loop = false;
  bool noAuth = false;
};

// The access token in `path`: its first line, which may hold only what an address and a cookie
// carry as they are.
std::optional<std::string> readToken(std::string_view path) {
  std::ifstream file{std::string(path)};
  std::string token;
  if (!file || !std::getline(file, token)) return std::nullopt;
  while (!token.empty() && std::isspace(static_cast<unsigned char>(token.back())))
    token.pop_back();
  const bool plain = std::all_of(token.begin(), token.end(), [](char c) {
    return std::isalnum(static_cast<unsigned char>(c)) || c == '-' || c == '.' || c == '_' ||
           c == '~';
  });
  if (token.empty() || !plain) return std::nullopt;
  return token;
}

// Empty, after saying why on standard error, when the values make no sense.
std::optional<ViewerOptions> judgeOptions(const GivenOptions& given) {
  const auto& [listen, service, replay, speed, tokenFile, loop, noAuth] = given;
  ViewerOptions options;
  if (listen) {
    const auto endpoint = ui::web::parseListenAddress(*listen);
    if (!endpoint) return refuse("--listen wants an address and a port, such as 127.0.0.1:8080");
    options.display.listen = *endpoint;
  }
  if (tokenFile && noAuth) return refuse("--token-file and --no-auth exclude each other");
  if (tokenFile) {
    options.display.token = readToken(*tokenFile);
    if (!options.display.token) {
      return refuse(platform::format(
          "--token-file %s: the file's first line must hold the token, made of letters, digits "
          "and - . _ ~",
          *tokenFile));
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
  if (service) {
    const auto choice = parseServiceChoice(*service);
    if (!choice) return refuse("--service wants builtin, dbus, dbus:system or dbus:ADDRESS");
    options.service = *choice;
  }
  if (speed == "max") {
    options.replay.speed = std::nullopt;
  } else if (speed) {
    options.replay.speed = platform::parseSpeedFactor(*speed);
    if (!options.replay.speed) return refuse("--speed wants a number above 0 or \"max\"");
  }
  options.replay.loop = loop;
  if (replay && options.service.bus) {
    return refuse(
        "--replay goes with the built-in service; on D-Bus, run\n"
        "       tarnd --source replay:LOG.jsonl");
  }
  if ((speed || loop) && !replay) return refuse("--speed and --loop go with --replay");
  if (replay) options.replayPath = std::string(*replay);
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

// How the viewer keeps up: the events its session dropped because it fell behind, by kind.
platform::Dictionary viewerStatus() {
  platform::Dictionary dropped;
  std::uint64_t total = 0;
  for (const auto& [kind, count] : tarn::client::droppedEvents()) {
    dropped.append(tarn::flow::kindName(kind), count);
    total += count;
  }
  return {{"dropped_events", total}, {"dropped_by_kind", std::move(dropped)}};
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
      {"--token-file", &given.tokenFile, "a file name"},
      {"--no-auth", &given.noAuth},
  };
  if (const auto exit = platform::openCommandLine({"norvo", kViewerUsage}, arguments, table, {},
                                                  std::cout, std::cerr)) {
    return *exit;
  }
  std::optional<ViewerOptions> options = judgeOptions(given);
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
  display.readings.emplace("status", [] { return platform::toJson(viewerStatus()); });
  AppDelegate delegate;
  return ui::applicationMain(delegate, mainInterface(), std::move(display));
}

}  // namespace app
