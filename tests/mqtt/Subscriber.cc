#include "Subscriber.h"

namespace mqtttest {

Subscriber::Subscriber(tarn::mqtt::LinkOptions options)
    : link_((options.name = "subscriber", std::move(options)),
            tarn::mqtt::Link::Handlers{
                .connected =
                    [this] {
                      const std::lock_guard lock(mutex_);
                      ++connections_;
                    },
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
                      ++subscriptions_;
                    },
            }) {
  link_.start();
}

std::vector<std::string> Subscriber::payloadsOn(std::string_view topic) const {
  const std::lock_guard lock(mutex_);
  std::vector<std::string> payloads;
  for (const auto& [on, payload] : messages_) {
    if (on == topic) payloads.push_back(payload);
  }
  return payloads;
}

std::size_t Subscriber::connections() const {
  const std::lock_guard lock(mutex_);
  return connections_;
}

std::size_t Subscriber::subscriptions() const {
  const std::lock_guard lock(mutex_);
  return subscriptions_;
}

}  // namespace mqtttest
