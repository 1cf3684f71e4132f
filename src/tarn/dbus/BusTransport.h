#pragma once

#include <string>

#include "tarn/client/Transport.h"

namespace tarn::dbus {

// Reaches the baseband manager service on a bus. Each connection is a client of its own on the
// bus, with its own thread.
//
// A session outlives the service: while the service is away, commands answer
// kServiceUnavailable and no events arrive; once it is back on the bus the session is opened
// again, the configurations the client last pushed are pushed again and its events are switched
// on again if they were on. A session opened while the service is away starts the same way.
class BusTransport final : public client::Transport {
 public:
  // `bus` as connectToBus takes it.
  explicit BusTransport(std::string bus);

  // Empty, after a warning on standard error and in the system log, when the bus cannot be
  // reached.
  std::unique_ptr<client::Connection> connect(const std::string& clientName,
                                              client::EventSink sink) override;

 private:
  const std::string bus_;
};

}  // namespace tarn::dbus
