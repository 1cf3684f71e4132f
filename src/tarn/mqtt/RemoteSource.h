#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "tarn/client/LinkStatus.h"
#include "tarn/mqtt/BrokerAddress.h"
#include "tarn/mqtt/Link.h"
#include "tarn/service/MetricSource.h"

namespace tarn::mqtt {

// Messages larger than this are refused unread: a metric line is a few hundred bytes.
inline constexpr std::size_t kLargestMetricMessage = 1 << 20;

// What one message on a metrics topic holds, or why it is refused: not JSON, bad base64, no
// metric ID, a metric ID without 0x3C in bits 16 to 23, or too large.
struct ReadMetric {
  std::optional<service::Metric> metric;
  std::string error;
};
ReadMetric readMetricMessage(std::string_view message);

// A device's state as its retained status message says it.
struct DeviceStatus {
  std::string status;  // "online", "offline", or empty before the first word
  std::string source;
  std::uint64_t dropped = 0;
};
// Empty when the message is no JSON object with a text "status".
std::optional<DeviceStatus> readStatusMessage(std::string_view message);

struct RemoteDevice {
  // Its path is PREFIX/DEVICE.
  BrokerAddress broker;
  std::optional<std::string> caFile;
  // The first word of log lines.
  std::string name;
};

// The metrics of a device that publishes to a broker (tarnd --publish), as a metric source:
// each metric as it arrives, and, for queries, the last metric of the kind asked for, which may
// be one the device keeps retained (PREFIX/DEVICE/latest/ID). Refused
// messages are counted and logged, one line each; status changes are logged too. While the
// broker or the device is away, nothing arrives and nothing else changes.
class RemoteSource final : public service::MetricSource {
 public:
  explicit RemoteSource(RemoteDevice device);
  ~RemoteSource() override;

  // Subscribes; throws std::runtime_error when the MQTT library refuses the options.
  void start(std::function<void(service::Metric)> deliver) override;
  void stop() override;
  std::optional<service::Metric> query(std::uint32_t metricId) override;

  DeviceStatus status() const;
  std::uint64_t refused() const;
  // Whether the broker is reached, said when it is and when it is lost.
  const std::shared_ptr<client::LinkStatus>& link() const { return brokerLink_; }

 private:
  void receive(std::string_view topic, std::string_view payload);

  const RemoteDevice device_;
  const std::string metricsTopic_;
  const std::string statusTopic_;
  const std::string latestTopics_;  // PREFIX/DEVICE/latest/

  std::function<void(service::Metric)> deliver_;
  mutable std::mutex mutex_;
  std::map<std::uint32_t, service::Metric> latest_;
  DeviceStatus status_;
  std::uint64_t refused_ = 0;

  const std::shared_ptr<client::LinkStatus> brokerLink_ = std::make_shared<client::LinkStatus>();
  std::unique_ptr<Link> link_;
};

}  // namespace tarn::mqtt
