#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string_view>
#include <vector>

#include "alerts/AlertRules.h"
#include "events/EventRing.h"
#include "platform/Value.h"

namespace alerts {

// The latest sample of a series: when it was taken (milliseconds since 1970) and its value.
struct Reading {
  std::int64_t timeMs;
  double value;
};
using SeriesReader = std::function<std::optional<Reading>(std::string_view series)>;

// Watches the rules, on the main queue. Times are the records' own, so that a replay at any
// speed sets off the alerts a live drive did. Each alert adds an event to the ring when it
// starts (a warning) and another when it clears.
class AlertMonitor {
 public:
  // A series that has had no sample for this long holds no level any more (the phone left
  // that technology), and its alert clears.
  static constexpr std::int64_t kStaleMs = 10'000;

  AlertMonitor(std::vector<AlertRule> rules, SeriesReader read, events::EventRing& ring);

  // After each metric the intake accepts, with its record's time, once the series have it.
  void metricArrived(std::int64_t timeMs);
  // Now, by the clock, while no metric comes: starts the silence alerts that are due.
  void tick(std::int64_t nowMs);
  // Nothing active, no metric seen; for a replay that starts over.
  void reset();

  // The alerts now active, oldest first: [{"name", "text", "since_ms"}].
  platform::List active() const;
  const std::vector<AlertRule>& rules() const { return rules_; }

 private:
  struct Watch {
    std::optional<std::int64_t> heldSinceMs;  // since when the condition holds
    std::optional<std::int64_t> activeSinceMs;
    std::string text;  // of the active alert
  };

  void start(std::size_t rule, std::int64_t atMs, std::string text);
  void clear(std::size_t rule, std::int64_t atMs, std::string text);
  void watchSeries(std::size_t rule, std::int64_t nowMs);

  const std::vector<AlertRule> rules_;
  const SeriesReader read_;
  events::EventRing& ring_;
  std::vector<Watch> watches_;
  std::optional<std::int64_t> lastMetricMs_;
};

}  // namespace alerts
