#pragma once

#include <functional>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tarn/mqtt/BrokerAddress.h"

struct mosquitto;
struct mosquitto_message;

namespace tarn::mqtt {

struct LinkOptions {
  BrokerAddress broker;
  // The certificate authority that signed an mqtts:// broker's certificate; without it, the
  // system's own authorities.
  std::optional<std::string> caFile;
  // Empty: the library makes one up. Two clients with one ID push each other off the broker.
  std::string clientId;
  // Retained and at QoS 1: what the broker publishes for us when we drop off without a word.
  std::optional<std::pair<std::string, std::string>> will;
  // False: the broker keeps the subscriptions, and the QoS 1 messages they catch, while the
  // client is away. Needs a client ID.
  bool cleanSession = true;
  // Subscribed again on every connection, at QoS 1.
  std::vector<std::string> subscriptions;
  // At most this many QoS 1 messages wait for the broker's acknowledgement; more wait in the
  // library.
  unsigned maxInflight = 100;
  // The first word of the link's log lines: "tarnd", "norvo".
  std::string name;
};

// One client connection to an MQTT broker, made by libmosquitto on a thread of its own, which
// reconnects with backoff (1 s doubling to 30 s) until the link is destroyed. Problems are
// logged on standard output once each, "NAME: ...", until the link is up again.
//
// The handlers run on the library's thread, one at a time; they may call publish().
class Link {
 public:
  struct Handlers {
    std::function<void()> connected;
    std::function<void()> disconnected;
    // The message with this ID has gone: acknowledged at QoS 1, written at QoS 0.
    std::function<void(int messageId)> published;
    std::function<void(std::string_view topic, std::string_view payload)> message;
    // The broker has taken one of the subscriptions.
    std::function<void()> subscribed;
  };

  // Throws std::runtime_error when the library refuses the options, such as an unreadable CA
  // file, saying why in one line.
  Link(LinkOptions options, Handlers handlers);
  // Starts connecting; the handlers may run from now on.
  void start();
  // Disconnects at once, without a last will, and stops the thread.
  ~Link();
  Link(const Link&) = delete;
  Link& operator=(const Link&) = delete;

  // Hands a message to the library without waiting for the network. The message's ID, or empty
  // when the library refuses it: too large, or at QoS 0 while the link is down.
  std::optional<int> publish(const std::string& topic, std::string_view payload, int qos,
                             bool retain);

  const LinkOptions& options() const { return options_; }

 private:
  static void onConnect(mosquitto*, void* self, int code);
  static void onDisconnect(mosquitto*, void* self, int code);
  static void onPublish(mosquitto*, void* self, int messageId);
  static void onMessage(mosquitto*, void* self, const mosquitto_message* message);
  static void onSubscribe(mosquitto*, void* self, int messageId, int count, const int* qos);
  static void onLog(mosquitto*, void* self, int level, const char* text);

  // Logs `problem` unless it was the last one logged since the link was last up.
  void report(const std::string& problem);

  const LinkOptions options_;
  const Handlers handlers_;
  std::mutex reportMutex_;
  std::string lastProblem_;
  bool up_ = false;  // on the library's thread
  mosquitto* client_ = nullptr;
};

}  // namespace tarn::mqtt
