#include "tarn/mqtt/MqttTransport.h"

namespace tarn::mqtt {

MqttTransport::MqttTransport(RemoteDevice device)
    : source_(std::make_shared<RemoteSource>(std::move(device))),
      core_(std::make_shared<service::Core>(source_)),
      inProcess_(core_) {}

std::unique_ptr<client::Connection> MqttTransport::connect(const std::string& clientName,
                                                           client::EventSink sink) {
  return inProcess_.connect(clientName, std::move(sink));
}

}  // namespace tarn::mqtt
