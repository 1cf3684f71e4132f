#include "tarn/mqtt/Link.h"

#include <mosquitto.h>

#include <stdexcept>
#include <utility>

#include "platform/Log.h"

namespace tarn::mqtt {

namespace {

constexpr int kKeepAliveSeconds = 10;
constexpr unsigned kFirstReconnectDelaySeconds = 1;
constexpr unsigned kLongestReconnectDelaySeconds = 30;
constexpr int kSubscriptionQos = 1;

void initialiseLibrary() {
  // Never cleaned up: links may live until the process exits.
  static const int initialised = mosquitto_lib_init();
  (void)initialised;
}

// The library explains MOSQ_ERR_ERRNO with the text of errno.
std::string describe(int code) {
  return mosquitto_strerror(code);
}

// Throws with `what` when the library answered `code` other than success.
void require(int code, std::string_view what) {
  if (code != MOSQ_ERR_SUCCESS)
    throw std::runtime_error(std::string(what) + ": " + mosquitto_strerror(code));
}

}  // namespace

Link::Link(LinkOptions options, Handlers handlers)
    : options_(std::move(options)), handlers_(std::move(handlers)) {
  initialiseLibrary();
  const char* id = options_.clientId.empty() ? nullptr : options_.clientId.c_str();
  client_ = mosquitto_new(id, options_.cleanSession, this);
  if (client_ == nullptr) throw std::runtime_error("cannot make an MQTT client");
  try {
    const BrokerAddress& broker = options_.broker;
    if (broker.user) {
      require(mosquitto_username_pw_set(client_, broker.user->c_str(),
                                        broker.password ? broker.password->c_str() : nullptr),
              "the broker's user name is refused");
    }
    if (broker.tls) {
      if (options_.caFile) {
        require(mosquitto_tls_set(client_, options_.caFile->c_str(), nullptr, nullptr, nullptr,
                                  nullptr),
                "cannot use " + *options_.caFile + " as the broker's certificate authority");
      } else {
        require(mosquitto_int_option(client_, MOSQ_OPT_TLS_USE_OS_CERTS, 1),
                "cannot use the system's certificate authorities");
      }
    }
    if (options_.will) {
      const auto& [topic, payload] = *options_.will;
      require(mosquitto_will_set(client_, topic.c_str(), static_cast<int>(payload.size()),
                                 payload.data(), 1, true),
              "the last will is refused");
    }
    mosquitto_max_inflight_messages_set(client_, options_.maxInflight);
    mosquitto_reconnect_delay_set(client_, kFirstReconnectDelaySeconds,
                                  kLongestReconnectDelaySeconds, true);
    mosquitto_connect_callback_set(client_, &Link::onConnect);
    mosquitto_disconnect_callback_set(client_, &Link::onDisconnect);
    mosquitto_publish_callback_set(client_, &Link::onPublish);
    mosquitto_message_callback_set(client_, &Link::onMessage);
    mosquitto_subscribe_callback_set(client_, &Link::onSubscribe);
    mosquitto_log_callback_set(client_, &Link::onLog);
  } catch (...) {
    mosquitto_destroy(client_);
    throw;
  }
}

void Link::start() {
  const BrokerAddress& broker = options_.broker;
  // A broker that cannot be reached yet is tried again by the library's thread.
  if (const int code =
          mosquitto_connect_async(client_, broker.host.c_str(), broker.port, kKeepAliveSeconds);
      code != MOSQ_ERR_SUCCESS) {
    report("cannot reach the broker at " + broker.endpoint() + ": " + describe(code) +
           "; trying again");
  }
  require(mosquitto_loop_start(client_), "cannot start the MQTT client's thread");
}

Link::~Link() {
  mosquitto_disconnect(client_);
  mosquitto_loop_stop(client_, false);
  mosquitto_destroy(client_);
}

std::optional<int> Link::publish(const std::string& topic, std::string_view payload, int qos,
                                 bool retain) {
  int messageId = 0;
  const int code = mosquitto_publish(client_, &messageId, topic.c_str(),
                                     static_cast<int>(payload.size()), payload.data(), qos, retain);
  if (code == MOSQ_ERR_SUCCESS) return messageId;
  if (code == MOSQ_ERR_NO_CONN) return std::nullopt;
  report("cannot publish on " + topic + ": " + describe(code));
  return std::nullopt;
}

void Link::report(const std::string& problem) {
  {
    const std::lock_guard lock(reportMutex_);
    if (problem == lastProblem_) return;
    lastProblem_ = problem;
  }
  // Unbuffered on standard error, so that it is seen while the link stays down.
  platform::log::warning(options_.name + ": " + problem);
}

void Link::onConnect(mosquitto* client, void* self, int code) {
  Link& link = *static_cast<Link*>(self);
  const std::string& endpoint = link.options_.broker.endpoint();
  if (code != 0) {
    link.report("the broker at " + endpoint +
                " refused the connection: " + mosquitto_connack_string(code));
    return;
  }
  {
    const std::lock_guard lock(link.reportMutex_);
    link.lastProblem_.clear();
  }
  link.up_ = true;
  platform::log::plain(link.options_.name + ": connected to the broker at " + endpoint);
  for (const std::string& pattern : link.options_.subscriptions)
    mosquitto_subscribe(client, nullptr, pattern.c_str(), kSubscriptionQos);
  if (link.handlers_.connected) link.handlers_.connected();
}

void Link::onDisconnect(mosquitto*, void* self, int code) {
  Link& link = *static_cast<Link*>(self);
  // A connection refused on its first reply has been reported already.
  const bool wasUp = std::exchange(link.up_, false);
  if (code != 0 && wasUp)
    link.report("lost the broker at " + link.options_.broker.endpoint() + ": " + describe(code) +
                "; trying again");
  if (link.handlers_.disconnected) link.handlers_.disconnected();
}

void Link::onPublish(mosquitto*, void* self, int messageId) {
  Link& link = *static_cast<Link*>(self);
  if (link.handlers_.published) link.handlers_.published(messageId);
}

void Link::onMessage(mosquitto*, void* self, const mosquitto_message* message) {
  Link& link = *static_cast<Link*>(self);
  if (!link.handlers_.message) return;
  const std::string_view payload(static_cast<const char*>(message->payload),
                                 static_cast<std::size_t>(message->payloadlen));
  link.handlers_.message(message->topic, payload);
}

void Link::onSubscribe(mosquitto*, void* self, int, int, const int*) {
  Link& link = *static_cast<Link*>(self);
  if (link.handlers_.subscribed) link.handlers_.subscribed();
}

void Link::onLog(mosquitto*, void* self, int level, const char* text) {
  // The library says why a TLS handshake failed only here.
  if (level == MOSQ_LOG_ERR) static_cast<Link*>(self)->report(text);
}

}  // namespace tarn::mqtt
