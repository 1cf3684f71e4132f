#pragma once

#include <memory>

#include "tarn/client/Transport.h"
#include "tarn/mqtt/RemoteSource.h"
#include "tarn/service/Core.h"
#include "tarn/transport/InProcess.h"

namespace tarn::mqtt {

// Reaches a device that publishes to a broker as if its baseband service ran here: sessions are
// served by a service inside the process whose baseband is the device's metrics topic. So a
// configuration push selects, as it does locally, which of the device's metrics a session
// receives, and a query is answered with the last metric of its kind that the device published
// (status 6 before there is one). Nothing is sent to the device.
class MqttTransport final : public client::Transport {
 public:
  // Subscribes at once; throws std::runtime_error when the MQTT library refuses the options.
  explicit MqttTransport(RemoteDevice device);

  std::unique_ptr<client::Connection> connect(const std::string& clientName,
                                              client::EventSink sink) override;

  const RemoteSource& device() const { return *source_; }
  const std::shared_ptr<client::LinkStatus>& link() const { return source_->link(); }

 private:
  std::shared_ptr<RemoteSource> source_;
  std::shared_ptr<service::Core> core_;
  transport::InProcess inProcess_;
};

}  // namespace tarn::mqtt
