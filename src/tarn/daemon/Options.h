#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>

#include "tarn/mm/SourceOption.h"
#include "tarn/mqtt/BrokerAddress.h"
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

// Where and how to publish the metrics over MQTT.
struct PublishChoice {
  // Its path is the topic prefix.
  mqtt::BrokerAddress broker;
  std::optional<std::string> caFile;
  // Empty: the host name.
  std::optional<std::string> device;
  int qos = 1;
  // Ten minutes of the simulated phone's metrics, which reports about 5.5 a second.
  std::size_t queueLimit = 4000;
};

// The --bus value of a tarnd that only publishes.
constexpr std::string_view kNoBus = "none";

struct DaemonOptions {
  std::variant<SimulatorChoice, ReplayChoice, ModemManagerChoice> source;
  // "session", "system", a D-Bus address, or "none" to serve no bus and only publish.
  std::string bus = "session";
  std::optional<PublishChoice> publish;
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
