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
  // `options` as a link takes them; its name and handlers are the subscriber's. Returns once the
  // broker has taken the subscriptions, or after 10 s.
  explicit Subscriber(tarn::mqtt::LinkOptions options);

  // The payloads that arrived on `topic`, in order.
  std::vector<std::string> payloadsOn(std::string_view topic) const;

 private:
  mutable std::mutex mutex_;
  std::vector<std::pair<std::string, std::string>> messages_;
  bool subscribed_ = false;
  tarn::mqtt::Link link_;  // last: its thread stops before the members it fills go
};

}  // namespace mqtttest
