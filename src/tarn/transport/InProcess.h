#pragma once

#include <memory>

#include "tarn/client/Transport.h"
#include "tarn/service/Core.h"

namespace tarn::transport {

// Reaches a service that runs inside the client's own process. Connections do not keep the
// service alive: once its last owner lets it go, their commands fail with kServiceUnavailable.
class InProcess final : public client::Transport {
 public:
  explicit InProcess(std::shared_ptr<service::Core> core);

  std::unique_ptr<client::Connection> connect(const std::string& clientName,
                                              client::EventSink sink) override;

 private:
  std::shared_ptr<service::Core> core_;
};

}  // namespace tarn::transport
