#include "app/ServiceOption.h"

#include "tarn/client/Transport.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/service/Core.h"
#include "tarn/transport/InProcess.h"

namespace app {

std::optional<ServiceChoice> parseServiceChoice(std::string_view text) {
  constexpr std::string_view kBusPrefix = "dbus:";
  if (text == "builtin") return ServiceChoice{};
  if (text == "dbus") return ServiceChoice{.bus = "session"};
  if (text.starts_with(kBusPrefix) && text.size() > kBusPrefix.size()) {
    return ServiceChoice{.bus = std::string(text.substr(kBusPrefix.size()))};
  }
  return std::nullopt;
}

void useService(const ServiceChoice& choice, std::shared_ptr<tarn::service::MetricSource> source) {
  if (choice.bus) {
    tarn::client::useTransport(std::make_shared<tarn::dbus::BusTransport>(*choice.bus));
  } else {
    tarn::client::useTransport(std::make_shared<tarn::transport::InProcess>(
        std::make_shared<tarn::service::Core>(std::move(source))));
  }
}

}  // namespace app
