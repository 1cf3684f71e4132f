#include "tarn/daemon/Options.h"

#include "platform/ParseNumber.h"

namespace tarn::daemon {

namespace {

// The arguments as given, before they are judged together.
struct GivenOptions {
  std::optional<std::string_view> source;
  std::optional<std::string_view> seed;
  std::optional<std::string_view> speed;
  std::optional<std::string_view> bus;
  std::optional<std::string_view> record;
  bool asFastAsPossible = false;
  bool loop = false;
  bool help = false;
};

struct ValueOption {
  std::string_view name;
  std::optional<std::string_view> GivenOptions::*value;
};

struct FlagOption {
  std::string_view name;
  bool GivenOptions::*flag;
};

constexpr ValueOption kValueOptions[] = {
    {"--source", &GivenOptions::source}, {"--seed", &GivenOptions::seed},
    {"--speed", &GivenOptions::speed},   {"--bus", &GivenOptions::bus},
    {"--record", &GivenOptions::record},
};

constexpr FlagOption kFlagOptions[] = {
    {"--as-fast-as-possible", &GivenOptions::asFastAsPossible},
    {"--loop", &GivenOptions::loop},
    {"--help", &GivenOptions::help},
    {"-h", &GivenOptions::help},
};

constexpr std::string_view kReplayPrefix = "replay:";

ParsedOptions refuse(std::string error) {
  return {std::nullopt, std::move(error)};
}

// A D-Bus address names its transport before a colon, as in unix:path=/run/user/1000/bus.
bool isBusChoice(std::string_view bus) {
  return bus == "session" || bus == "system" || bus.find(':') != std::string_view::npos;
}

// Empty, after saying why in `error`, when an argument is unknown or lacks its value.
std::optional<GivenOptions> collect(std::span<const std::string_view> arguments,
                                    std::string& error) {
  GivenOptions given;
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    const std::string_view argument = arguments[i];
    bool known = false;
    for (const FlagOption& option : kFlagOptions) {
      if (option.name != argument) continue;
      given.*option.flag = true;
      known = true;
    }
    for (const ValueOption& option : kValueOptions) {
      if (option.name != argument) continue;
      if (i + 1 == arguments.size()) {
        error = std::string(argument) + " needs a value";
        return std::nullopt;
      }
      given.*option.value = arguments[++i];
      known = true;
    }
    if (!known) {
      error = argument.starts_with('-') ? "unknown option " + std::string(argument)
                                        : "unexpected argument " + std::string(argument);
      return std::nullopt;
    }
  }
  return given;
}

}  // namespace

ParsedOptions parseDaemonOptions(std::span<const std::string_view> arguments) {
  std::string error;
  const std::optional<GivenOptions> given = collect(arguments, error);
  if (!given) return refuse(error);

  DaemonOptions options;
  options.help = given->help;
  if (options.help) return {options, {}};

  // --speed max is norvo's spelling of --as-fast-as-possible.
  const bool asFastAsPossible = given->asFastAsPossible || given->speed == "max";
  std::optional<double> speed;
  if (given->speed && *given->speed != "max") {
    speed = platform::parseSpeedFactor(*given->speed);
    if (!speed) return refuse("--speed wants a number above 0");
  }
  const std::string_view source = given->source.value_or("sim");
  if (source == "sim") {
    if (asFastAsPossible || given->loop)
      return refuse("--as-fast-as-possible and --loop go with --source replay:FILE");
    SimulatorChoice simulator;
    if (given->seed) {
      const std::optional<std::uint64_t> seed = platform::parseNumber<std::uint64_t>(*given->seed);
      if (!seed) return refuse("--seed wants a whole number of at least 0");
      simulator.seed = *seed;
    }
    simulator.speed = speed.value_or(simulator.speed);
    options.source = simulator;
  } else if (source.starts_with(kReplayPrefix) && source.size() > kReplayPrefix.size()) {
    if (given->seed) return refuse("--seed goes with --source sim");
    if (speed && given->asFastAsPossible)
      return refuse("--speed and --as-fast-as-possible exclude each other");
    ReplayChoice replay{std::string(source.substr(kReplayPrefix.size())), {}};
    replay.options.loop = given->loop;
    if (asFastAsPossible)
      replay.options.speed = std::nullopt;
    else if (speed)
      replay.options.speed = speed;
    options.source = std::move(replay);
  } else {
    return refuse("--source wants sim or replay:FILE.jsonl, not " + std::string(source));
  }

  if (given->bus) {
    if (!isBusChoice(*given->bus))
      return refuse(
          "--bus wants session, system or a D-Bus address such as "
          "unix:path=/run/user/1000/bus");
    options.bus = std::string(*given->bus);
  }
  if (given->record) {
    if (given->record->empty()) return refuse("--record needs a file name");
    options.recordPath = std::string(*given->record);
  }
  return {std::move(options), {}};
}

}  // namespace tarn::daemon
