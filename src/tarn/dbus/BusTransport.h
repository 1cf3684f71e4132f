#pragma once

#include <chrono>
#include <memory>
#include <string>

#include "tarn/client/LinkStatus.h"
#include "tarn/client/Transport.h"

namespace tarn::dbus {

// How long a session waits before trying an unreachable bus again: `first`, then twice as long
// each time up to `longest`, and `first` again once the bus has been reached.
struct Backoff {
  std::chrono::milliseconds first{250};
  std::chrono::milliseconds longest{10'000};
};

// Reaches the baseband manager service on a bus. Each connection is a client of its own on the
// bus, with its own thread.
//
// A session outlives the service and the bus: while either is away, commands answer
// kServiceUnavailable and no events arrive. A bus that cannot be reached, or whose connection
// breaks, is tried again with `backoff` until it answers; a service that leaves is waited for on
// the bus. Once both are back the session is opened again, the configurations the client last
// pushed are pushed again and its events are switched on again if they were on. A session opened
// while either is away starts the same way. The first failure and each return are said once, on
// standard error and in the log, and `link` tells how things stand.
class BusTransport final : public client::Transport {
 public:
  // `bus` as connectToBus takes it.
  explicit BusTransport(std::string bus, Backoff backoff = {},
                        std::shared_ptr<client::LinkStatus> link = nullptr);

  // Never empty.
  std::unique_ptr<client::Connection> connect(const std::string& clientName,
                                              client::EventSink sink) override;

  const std::shared_ptr<client::LinkStatus>& link() const { return link_; }

 private:
  const std::string bus_;
  const Backoff backoff_;
  const std::shared_ptr<client::LinkStatus> link_;
};

}  // namespace tarn::dbus
