#pragma once

#include <cstddef>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "tarn/mqtt/Link.h"

namespace mqtttest {

// A client that subscribes to topics on a broker and keeps every message that arrives.
class Subscriber {
 public:
  // `options` as a link takes them; its name and handlers are the subscriber's.
  explicit Subscriber(tarn::mqtt::LinkOptions options);

  // The payloads that arrived on `topic`, in order.
  std::vector<std::string> payloadsOn(std::string_view topic) const;
  std::size_t connections() const;
  // Subscriptions the broker has taken, over all connections.
  std::size_t subscriptions() const;

 private:
  mutable std::mutex mutex_;
  std::vector<std::pair<std::string, std::string>> messages_;
  std::size_t connections_ = 0;
  std::size_t subscriptions_ = 0;
  tarn::mqtt::Link link_;  // last: its thread stops before the members it fills go
};

}  // namespace mqtttest
