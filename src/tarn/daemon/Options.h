#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>

#include "tarn/mm/SourceOption.h"
#include "tarn/replay/ReplaySource.h"

namespace tarn::daemon {

struct SimulatorChoice {
  std::uint64_t seed = 1;
  double speed = 1.0;
};

struct ReplayChoice {
  std::string path;
  replay::ReplayOptions options;
};

// A real modem through ModemManager on the system bus.
struct ModemManagerChoice {
  std::string modem;  // empty for the first
  std::chrono::seconds refresh = mm::kDefaultRefresh;
};

struct DaemonOptions {
  std::variant<SimulatorChoice, ReplayChoice, ModemManagerChoice> source;
  // "session", "system" or a D-Bus address.
  std::string bus = "session";
  std::optional<std::string> recordPath;
  bool help = false;
};

// Parsed options, or what is wrong with the arguments, in one line.
struct ParsedOptions {
  std::optional<DaemonOptions> options;
  std::string error;
};

// Reads tarnd's arguments, without the program name.
ParsedOptions parseDaemonOptions(std::span<const std::string_view> arguments);

}  // namespace tarn::daemon
