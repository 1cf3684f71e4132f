#include "app/ViewerAlerts.h"

#include <chrono>
#include <iostream>

namespace app {

namespace {

std::int64_t wallClockMs() {
  return std::chrono::duration_cast<std::chrono::milliseconds>(
             std::chrono::system_clock::now().time_since_epoch())
      .count();
}

}  // namespace

std::vector<alerts::AlertRule> viewerAlertRules(const std::optional<std::string>& file) {
  const std::optional<std::string> path = file ? file : alerts::userRulesPath();
  if (!path) return alerts::defaultRules();
  alerts::LoadedRules loaded = alerts::loadRules(*path, file.has_value());
  for (const std::string& error : loaded.errors)
    std::cerr << "norvo: " << error << '\n';
  if (!loaded.errors.empty()) std::cerr << "norvo: starting with the built-in alerts\n";
  return std::move(loaded.rules);
}

ViewerAlerts::ViewerAlerts(std::vector<alerts::AlertRule> rules, alerts::SeriesReader read,
                           store::MetricValidator& intake, events::EventRing& ring, bool live)
    : monitor_(std::move(rules), std::move(read), ring) {
  intake.addAcceptedMetricObserver(
      [this](std::int64_t, const platform::Bytes*, const platform::Dictionary& decoded) {
        const platform::Value* timestamp = decoded.find("timestamp");
        if (const auto ms = timestamp != nullptr ? timestamp->asInteger() : std::nullopt)
          lastTimeMs_ = *ms;
        monitor_.metricArrived(lastTimeMs_);
      });
  if (live) {
    clock_ = ui::Timer::scheduledTimer(
        std::chrono::seconds(1), [this] { monitor_.tick(wallClockMs()); }, true);
  }
}

void ViewerAlerts::reset() {
  monitor_.reset();
  lastTimeMs_ = 0;
}

}  // namespace app
