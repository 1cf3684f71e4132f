#include "tarn/daemon/Options.h"

#include "platform/CommandLine.h"
#include "platform/Format.h"
#include "platform/ParseNumber.h"
#include "tarn/sim/SimulatorSource.h"

namespace tarn::daemon {

namespace {

// The arguments as given, before they are judged together.
struct GivenOptions {
  std::optional<std::string_view> source;
  std::optional<std::string_view> seed;
  std::optional<std::string_view> speed;
  std::optional<std::string_view> bus;
  std::optional<std::string_view> record;
  std::optional<std::string_view> refresh;
  std::optional<std::string_view> publish;
  std::optional<std::string_view> caFile;
  std::optional<std::string_view> device;
  std::optional<std::string_view> qos;
  std::optional<std::string_view> queue;
  bool asFastAsPossible = false;
  bool loop = false;
};

constexpr std::string_view kReplayPrefix = "replay:";

ParsedOptions refuse(std::string error) {
  return {std::nullopt, std::move(error)};
}

// A D-Bus address names its transport before a colon, as in unix:path=/run/user/1000/bus.
bool isBusChoice(std::string_view bus) {
  return bus == "session" || bus == "system" || bus == kNoBus ||
         bus.find(':') != std::string_view::npos;
}

// The MQTT options, judged together; empty `error` when they make sense.
std::optional<PublishChoice> readPublishChoice(const GivenOptions& given, std::string& error) {
  if (!given.publish) {
    if (given.caFile || given.device || given.qos || given.queue)
      error = "--mqtt-ca, --device, --qos and --mqtt-queue go with --publish";
    return std::nullopt;
  }
  mqtt::ParsedBrokerAddress parsed = mqtt::parseBrokerAddress(*given.publish);
  if (!parsed.address) {
    error = "--publish: " + parsed.error;
    return std::nullopt;
  }
  PublishChoice publish;
  publish.broker = std::move(*parsed.address);
  if (given.caFile) {
    if (!publish.broker.tls) {
      error = "--mqtt-ca goes with an mqtts:// broker";
      return std::nullopt;
    }
    publish.caFile = std::string(*given.caFile);
  }
  if (given.device) {
    if (!mqtt::isTopicLevel(*given.device)) {
      error = "--device wants a name without \"/\", \"+\" or \"#\"";
      return std::nullopt;
    }
    publish.device = std::string(*given.device);
  }
  if (given.qos) {
    if (*given.qos != "0" && *given.qos != "1") {
      error = "--qos wants 0 or 1";
      return std::nullopt;
    }
    publish.qos = *given.qos == "1" ? 1 : 0;
  }
  if (given.queue) {
    const auto limit = platform::parseNumber<std::size_t>(*given.queue);
    if (!limit) {
      error = "--mqtt-queue wants a number of metrics";
      return std::nullopt;
    }
    publish.queueLimit = *limit;
  }
  return publish;
}

}  // namespace

ParsedOptions parseDaemonOptions(std::span<const std::string_view> arguments) {
  DaemonOptions options;
  options.help = platform::asksForHelp(arguments);
  if (options.help) return {options, {}};

  GivenOptions given;
  const platform::CommandLineOption table[] = {
      {"--source", &given.source},
      {"--seed", &given.seed},
      {"--speed", &given.speed},
      {"--bus", &given.bus},
      {"--record", &given.record},
      {"--as-fast-as-possible", &given.asFastAsPossible},
      {"--loop", &given.loop},
      {"--refresh", &given.refresh},
      {"--publish", &given.publish, "a broker address"},
      {"--mqtt-ca", &given.caFile, "a certificate file"},
      {"--device", &given.device, "a name"},
      {"--qos", &given.qos},
      {"--mqtt-queue", &given.queue, "a number of metrics"},
  };
  if (std::string error = platform::readCommandLine(arguments, table); !error.empty())
    return refuse(std::move(error));

  // --speed max is norvo's spelling of --as-fast-as-possible.
  const bool asFastAsPossible = given.asFastAsPossible || given.speed == "max";
  std::optional<double> speed;
  if (given.speed && *given.speed != "max") {
    speed = platform::parseSpeedFactor(*given.speed);
    if (!speed) return refuse("--speed wants a number above 0");
  }
  const std::string_view source = given.source.value_or("sim");
  const std::optional<std::string> modem = mm::parseModemManagerSource(source);
  if (given.refresh && !modem) return refuse("--refresh goes with --source modemmanager");
  if (modem) {
    if (given.seed || speed || asFastAsPossible || given.loop)
      return refuse("--seed, --speed, --as-fast-as-possible and --loop do not go with a modem");
    ModemManagerChoice choice{.modem = *modem};
    if (given.refresh) {
      const std::optional<std::chrono::seconds> refresh = mm::parseRefresh(*given.refresh);
      if (!refresh) return refuse(std::string(mm::kRefreshWanted));
      choice.refresh = *refresh;
    }
    options.source = std::move(choice);
  } else if (source == "sim") {
    if (asFastAsPossible || given.loop)
      return refuse("--as-fast-as-possible and --loop go with --source replay:FILE");
    SimulatorChoice simulator;
    if (given.seed) {
      const std::optional<std::uint64_t> seed = platform::parseNumber<std::uint64_t>(*given.seed);
      if (!seed) return refuse("--seed wants a whole number of at least 0");
      simulator.seed = *seed;
    }
    if (speed > sim::SimulatorSource::kFastest) {
      return refuse(platform::format("--speed of the simulator is at most %g, not %s",
                                     sim::SimulatorSource::kFastest, *given.speed));
    }
    simulator.speed = speed.value_or(simulator.speed);
    options.source = simulator;
  } else if (source.starts_with(kReplayPrefix) && source.size() > kReplayPrefix.size()) {
    if (given.seed) return refuse("--seed goes with --source sim");
    if (speed && given.asFastAsPossible)
      return refuse("--speed and --as-fast-as-possible exclude each other");
    ReplayChoice replay{std::string(source.substr(kReplayPrefix.size())), {}};
    replay.options.loop = given.loop;
    if (asFastAsPossible)
      replay.options.speed = std::nullopt;
    else if (speed)
      replay.options.speed = speed;
    options.source = std::move(replay);
  } else {
    return refuse("--source wants sim, replay:FILE.jsonl or modemmanager[:MODEM], not " +
                  std::string(source));
  }

  if (given.bus) {
    if (!isBusChoice(*given.bus))
      return refuse(
          "--bus wants session, system, none or a D-Bus address such as "
          "unix:path=/run/user/1000/bus");
    options.bus = std::string(*given.bus);
  }
  std::string publishError;
  options.publish = readPublishChoice(given, publishError);
  if (!publishError.empty()) return refuse(std::move(publishError));
  if (options.bus == kNoBus && !options.publish)
    return refuse("--bus none serves nobody: it goes with --publish");
  if (given.record) {
    if (given.record->empty()) return refuse("--record needs a file name");
    options.recordPath = std::string(*given.record);
  }
  return {std::move(options), {}};
}

}  // namespace tarn::daemon
