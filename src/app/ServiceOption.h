#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "tarn/client/LinkStatus.h"
#include "tarn/mqtt/BrokerAddress.h"
#include "tarn/service/MetricSource.h"

namespace app {

// Where the baseband manager service runs: inside Norvo, as tarnd on a bus, or as a tarnd
// elsewhere that publishes to an MQTT broker.
struct ServiceChoice {
  // The bus, as tarn::dbus::connectToBus takes it.
  std::optional<std::string> bus{};
  // The broker and the device's topics: mqtt://HOST[:PORT]/PREFIX/DEVICE.
  std::optional<tarn::mqtt::BrokerAddress> broker{};
  // The certificate authority of an mqtts:// broker.
  std::optional<std::string> caFile{};

  // Neither on a bus nor behind a broker.
  bool builtIn() const { return !bus && !broker; }
  bool operator==(const ServiceChoice&) const = default;
};

// What --service says in its usage and when it is refused.
extern const std::string_view kServiceChoices;

// The value of a --service option: "builtin", "dbus", "dbus:session", "dbus:system",
// "dbus:" followed by a D-Bus address, or a broker address whose path has a prefix and a
// device, mqtt[s]://[USER[:PASS]@]HOST[:PORT]/PREFIX/DEVICE. Empty for anything else.
std::optional<ServiceChoice> parseServiceChoice(std::string_view text);

// Sessions opened from now on reach the chosen service; the one inside Norvo runs `source`.
// Answers how the way to a service on a bus or behind a broker stands, or null for the one
// inside Norvo, which is always there. Throws std::runtime_error when the MQTT library refuses
// the broker's options.
std::shared_ptr<const tarn::client::LinkStatus> useService(
    const ServiceChoice& choice, std::shared_ptr<tarn::service::MetricSource> source);

}  // namespace app
