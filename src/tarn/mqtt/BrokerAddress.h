#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tarn::mqtt {

// Where a broker is and which topics under it: mqtt://[USER[:PASS]@]HOST[:PORT]/PATH, or
// mqtts:// for TLS. PATH is the topic prefix, or the prefix and a device (PREFIX/DEVICE).
struct BrokerAddress {
  bool tls = false;
  std::optional<std::string> user;
  std::optional<std::string> password;
  std::string host;  // an IPv6 address without its brackets
  std::uint16_t port = 0;
  std::string path;  // topic levels, without leading or trailing "/"

  // mqtt://HOST:PORT/PATH, without the user and password, for messages.
  std::string shown() const;
  // The whole address, user and password included, as parseBrokerAddress reads it.
  std::string text() const;
  // HOST:PORT, with brackets around an IPv6 address.
  std::string endpoint() const;

  bool operator==(const BrokerAddress&) const = default;
};

struct ParsedBrokerAddress {
  std::optional<BrokerAddress> address;
  std::string error;  // what is wrong, in one line, when there is no address
};

constexpr std::uint16_t kMqttPort = 1883;
constexpr std::uint16_t kMqttsPort = 8883;

// Refuses another scheme, an empty host, a port that is no number from 1 to 65535, and a path
// that is empty, has an empty level or holds the wildcards "+" and "#".
ParsedBrokerAddress parseBrokerAddress(std::string_view text);

// Whether `level` may stand for one topic level: not empty, without "/", "+", "#" or NUL.
bool isTopicLevel(std::string_view level);

// PREFIX/DEVICE/metrics: one message per metric, one metric log line each.
std::string metricsTopic(std::string_view prefix, std::string_view device);
// PREFIX/DEVICE/status: retained, the device's state ("online" or "offline").
std::string statusTopic(std::string_view prefix, std::string_view device);
// PREFIX/DEVICE/latest/0x3C0013: retained, the last metric of a kind that the baseband reports
// only once, such as the SIM files at power-on, for viewers that join later.
std::string latestTopic(std::string_view prefix, std::string_view device, std::uint32_t metricId);

}  // namespace tarn::mqtt
