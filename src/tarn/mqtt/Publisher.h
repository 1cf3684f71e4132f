#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "tarn/mqtt/BrokerAddress.h"
#include "tarn/mqtt/Link.h"

namespace tarn::mqtt {

struct PublisherOptions {
  // Its path is the topic prefix.
  BrokerAddress broker;
  std::optional<std::string> caFile;
  // One topic level: the device's name under the prefix.
  std::string device;
  // 0 or 1.
  int qos = 1;
  // Metrics held while the broker is away; past this the oldest go.
  std::size_t queueLimit = 0;
  // What produces the metrics, for the status message: "sim, seed 7".
  std::string source;
  // The first word of log lines.
  std::string name;
};

// Publishes one device's metrics to PREFIX/DEVICE/metrics, and its state, retained, to
// PREFIX/DEVICE/status: "online" with the source, the versions and the metrics dropped so far
// once connected, "offline" as the last will and on a clean stop.
//
// publish() never waits on the broker: while the link is down, or the broker is slower than the
// metrics, messages wait in a bounded queue in order, and the oldest are dropped and counted when
// it is full. When the link returns, one log line says how many were dropped while it was away.
class Publisher {
 public:
  struct Counts {
    std::uint64_t accepted = 0;  // handed to publish()
    std::uint64_t sent = 0;      // acknowledged by the broker (written, at QoS 0)
    std::uint64_t dropped = 0;   // pushed out of a full queue
    std::size_t queued = 0;      // waiting now, in the queue and in flight
    bool linked = false;         // connected to the broker now
  };

  // Starts connecting; throws std::runtime_error for options the MQTT library refuses.
  explicit Publisher(PublisherOptions options);
  // Says "offline", waiting a moment for the broker to take it, then disconnects. Metrics still
  // queued are not sent.
  ~Publisher();
  Publisher(const Publisher&) = delete;
  Publisher& operator=(const Publisher&) = delete;

  // One metric log line. Any thread.
  void publish(std::string line);
  // Keeps `line` retained on `topic`, now and on every connection, replacing what was there.
  void retain(const std::string& topic, std::string line);

  Counts counts() const;

  // The status message for `state` ("online", "offline"), as JSON; with the drops so far
  // unless it is the last will, which is written before any.
  std::string statusMessage(std::string_view state, bool withDrops = true) const;

 private:
  void connected();
  void disconnected();
  void published(int messageId);
  // Needs mutex_ held.
  void sendWaiting();
  bool send(const std::string& line);
  void sendRetained(const std::string& topic, const std::string& message);

  const PublisherOptions options_;
  const std::string metricsTopic_;
  const std::string statusTopic_;

  mutable std::mutex mutex_;
  std::condition_variable statusSent_;
  std::deque<std::string> waiting_;
  std::size_t inflight_ = 0;
  bool connected_ = false;
  // Retained messages on their way, by message ID: they are no metrics.
  std::vector<int> retainedIds_;
  std::map<std::string, std::string> retained_;
  std::uint64_t droppedSinceLink_ = 0;
  Counts counts_;

  // Last, so that its thread stops before the members its handlers use go.
  std::unique_ptr<Link> link_;
};

}  // namespace tarn::mqtt
