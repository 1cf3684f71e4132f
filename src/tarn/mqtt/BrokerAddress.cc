#include "tarn/mqtt/BrokerAddress.h"

#include <cstdio>

#include "platform/ParseNumber.h"

namespace tarn::mqtt {

namespace {

constexpr std::string_view kMqttScheme = "mqtt://";
constexpr std::string_view kMqttsScheme = "mqtts://";

ParsedBrokerAddress refuse(std::string error) {
  return {std::nullopt, std::move(error)};
}

}  // namespace

std::string BrokerAddress::endpoint() const {
  const bool ipv6 = host.find(':') != std::string::npos;
  return (ipv6 ? "[" + host + "]" : host) + ":" + std::to_string(port);
}

std::string BrokerAddress::shown() const {
  return std::string(tls ? kMqttsScheme : kMqttScheme) + endpoint() + "/" + path;
}

std::string BrokerAddress::text() const {
  std::string credentials;
  if (user) credentials = *user + (password ? ":" + *password : "") + "@";
  return std::string(tls ? kMqttsScheme : kMqttScheme) + credentials + endpoint() + "/" + path;
}

bool isTopicLevel(std::string_view level) {
  return !level.empty() && level.find_first_of(std::string_view("/+#\0", 4)) == level.npos;
}

ParsedBrokerAddress parseBrokerAddress(std::string_view text) {
  BrokerAddress address;
  if (text.starts_with(kMqttScheme)) {
    text.remove_prefix(kMqttScheme.size());
  } else if (text.starts_with(kMqttsScheme)) {
    text.remove_prefix(kMqttsScheme.size());
    address.tls = true;
  } else {
    return refuse("a broker address starts with mqtt:// or mqtts://");
  }
  const std::size_t slash = text.find('/');
  std::string_view authority = text.substr(0, slash);
  const std::string_view path = slash == text.npos ? std::string_view() : text.substr(slash + 1);

  if (const std::size_t at = authority.rfind('@'); at != authority.npos) {
    const std::string_view credentials = authority.substr(0, at);
    authority.remove_prefix(at + 1);
    const std::size_t colon = credentials.find(':');
    address.user = std::string(credentials.substr(0, colon));
    if (colon != credentials.npos) address.password = std::string(credentials.substr(colon + 1));
    if (address.user->empty()) return refuse("the broker address has an empty user name");
  }

  std::string_view port;
  if (authority.starts_with('[')) {
    const std::size_t close = authority.find(']');
    if (close == authority.npos) return refuse("the broker's IPv6 address lacks its \"]\"");
    address.host = std::string(authority.substr(1, close - 1));
    authority.remove_prefix(close + 1);
    if (!authority.empty() && !authority.starts_with(':'))
      return refuse("the broker's port follows its address after \":\"");
    if (!authority.empty()) port = authority.substr(1);
  } else {
    const std::size_t colon = authority.find(':');
    address.host = std::string(authority.substr(0, colon));
    if (colon != authority.npos) port = authority.substr(colon + 1);
  }
  if (address.host.empty()) return refuse("the broker address has no host");
  address.port = address.tls ? kMqttsPort : kMqttPort;
  if (!port.empty() || authority.ends_with(':')) {
    const auto number = platform::parseNumber<std::uint16_t>(port);
    if (!number || *number == 0) return refuse("the broker's port is a number from 1 to 65535");
    address.port = *number;
  }

  std::string_view rest = path;
  if (rest.ends_with('/')) rest.remove_suffix(1);
  if (rest.empty()) return refuse("the broker address needs a topic prefix after the host");
  while (!rest.empty()) {
    const std::size_t next = rest.find('/');
    if (!isTopicLevel(rest.substr(0, next)))
      return refuse("topic levels are not empty and hold no \"+\" or \"#\"");
    rest = next == rest.npos ? std::string_view() : rest.substr(next + 1);
  }
  address.path = std::string(path.ends_with('/') ? path.substr(0, path.size() - 1) : path);
  return {std::move(address), {}};
}

std::string metricsTopic(std::string_view prefix, std::string_view device) {
  return std::string(prefix) + "/" + std::string(device) + "/metrics";
}

std::string latestTopic(std::string_view prefix, std::string_view device, std::uint32_t metricId) {
  char hex[16];
  std::snprintf(hex, sizeof hex, "0x%X", metricId);
  return std::string(prefix) + "/" + std::string(device) + "/latest/" + hex;
}

std::string statusTopic(std::string_view prefix, std::string_view device) {
  return std::string(prefix) + "/" + std::string(device) + "/status";
}

}  // namespace tarn::mqtt
