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
  // The longest text parse() takes: over a thousand times the shipped configuration, yet read in
  // milliseconds while other clients wait.
  static constexpr std::size_t kLargestText = 1024 * 1024;

  // Throws ConfigurationError. Takes time in proportion to the text's length.
  static Configuration parse(std::string_view text);

  // The profile ID of the subscription to `metricId`; empty when the metric is not subscribed.
  std::optional<std::int64_t> profileOf(std::uint32_t metricId) const;
  std::size_t size() const { return profiles_.size(); }

 private:
  std::unordered_map<std::uint32_t, std::int64_t> profiles_;
};

}  // namespace tarn::service
