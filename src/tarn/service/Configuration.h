#pragma once

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string_view>
#include <unordered_map>

// An app's metric configuration: which metrics it subscribes to, and under which profile. The
// text format is described in docs/configuration.md.
namespace tarn::service {

// Says what is wrong with a configuration text, and on which line.
class ConfigurationError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

class Configuration {
 public:
  // Throws ConfigurationError.
  static Configuration parse(std::string_view text);

  // The profile ID of the subscription to `metricId`; empty when the metric is not subscribed.
  std::optional<std::int64_t> profileOf(std::uint32_t metricId) const;
  std::size_t size() const { return profiles_.size(); }

 private:
  std::unordered_map<std::uint32_t, std::int64_t> profiles_;
};

}  // namespace tarn::service
