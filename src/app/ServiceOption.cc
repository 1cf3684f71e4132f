#include "app/ServiceOption.h"

#include "tarn/client/Transport.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/mqtt/MqttTransport.h"
#include "tarn/service/Core.h"
#include "tarn/transport/InProcess.h"

namespace app {

const std::string_view kServiceChoices =
    "builtin, dbus, dbus:system, dbus:ADDRESS or mqtt://HOST[:PORT]/PREFIX/DEVICE";

std::optional<ServiceChoice> parseServiceChoice(std::string_view text) {
  constexpr std::string_view kBusPrefix = "dbus:";
  if (text.starts_with("mqtt")) {
    auto parsed = tarn::mqtt::parseBrokerAddress(text);
    if (!parsed.address || parsed.address->path.find('/') == std::string::npos) return std::nullopt;
    return ServiceChoice{.bus = std::nullopt, .broker = std::move(parsed.address), .caFile = {}};
  }
  if (text == "builtin") return ServiceChoice{};
  if (text == "dbus") return ServiceChoice{.bus = "session"};
  if (text.starts_with(kBusPrefix) && text.size() > kBusPrefix.size()) {
    return ServiceChoice{.bus = std::string(text.substr(kBusPrefix.size()))};
  }
  return std::nullopt;
}

std::shared_ptr<const tarn::client::LinkStatus> useService(
    const ServiceChoice& choice, std::shared_ptr<tarn::service::MetricSource> source) {
  if (choice.bus) {
    auto transport = std::make_shared<tarn::dbus::BusTransport>(*choice.bus);
    tarn::client::useTransport(transport);
    return transport->link();
  }
  if (choice.broker) {
    auto transport = std::make_shared<tarn::mqtt::MqttTransport>(
        tarn::mqtt::RemoteDevice{*choice.broker, choice.caFile, "norvo"});
    tarn::client::useTransport(transport);
    return transport->link();
  }
  tarn::client::useTransport(std::make_shared<tarn::transport::InProcess>(
      std::make_shared<tarn::service::Core>(std::move(source))));
  return nullptr;
}

}  // namespace app
