#include "Subscriber.h"

#include "Eventually.h"

namespace mqtttest {

Subscriber::Subscriber(tarn::mqtt::LinkOptions options)
    : link_((options.name = "subscriber", std::move(options)),
            tarn::mqtt::Link::Handlers{
                .connected = {},
                .disconnected = {},
                .published = {},
                .message =
                    [this](std::string_view topic, std::string_view payload) {
                      const std::lock_guard lock(mutex_);
                      messages_.emplace_back(topic, payload);
                    },
                .subscribed =
                    [this] {
                      const std::lock_guard lock(mutex_);
                      subscribed_ = true;
                    },
            }) {
  link_.start();
  bustest::eventually([this] {
    const std::lock_guard lock(mutex_);
    return subscribed_;
  });
}

std::vector<std::string> Subscriber::payloadsOn(std::string_view topic) const {
  const std::lock_guard lock(mutex_);
  std::vector<std::string> payloads;
  for (const auto& [on, payload] : messages_) {
    if (on == topic) payloads.push_back(payload);
  }
  return payloads;
}

}  // namespace mqtttest
