#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "tarn/service/MetricSource.h"

namespace app {

// Where the baseband manager service runs: inside Norvo, or as tarnd on a bus.
struct ServiceChoice {
  // The bus, as tarn::dbus::connectToBus takes it; empty for the service inside Norvo.
  std::optional<std::string> bus;

  bool operator==(const ServiceChoice&) const = default;
};

// The value of a --service option: "builtin", "dbus", "dbus:session", "dbus:system" or
// "dbus:" followed by a D-Bus address. Empty for anything else.
std::optional<ServiceChoice> parseServiceChoice(std::string_view text);

// Sessions opened from now on reach the chosen service; the one inside Norvo runs `source`.
void useService(const ServiceChoice& choice, std::shared_ptr<tarn::service::MetricSource> source);

}  // namespace app
