#pragma once

#include <span>
#include <string_view>

namespace app {

// What `norvo --help` says about the fleet viewer.
extern const std::string_view kFleetUsage;

// `norvo --fleet mqtt://HOST[:PORT]/PREFIX [--listen ADDR:PORT] [--mqtt-ca FILE]`: serves the
// fleet page for every device that publishes under PREFIX until Ctrl-C. Answers the exit status.
int runFleet(std::span<const std::string_view> arguments);

}  // namespace app
