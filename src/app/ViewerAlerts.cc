#include "app/ViewerAlerts.h"

#include <iostream>

namespace app {

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
                           store::MetricValidator& intake, const RecordClock& recordTime,
                           events::EventRing& ring, bool live)
    : monitor_(std::move(rules), std::move(read), ring) {
  intake.addStoreObserver([this, &recordTime](store::DisplayDictionary, const auto&) {
    monitor_.metricArrived(recordTime.nowMs());
  });
  if (live) {
    clock_ = ui::Timer::scheduledTimer(
        std::chrono::seconds(1), [this] { monitor_.tick(RecordClock::wallClockMs()); }, true);
  }
}

void ViewerAlerts::reset() {
  monitor_.reset();
}

}  // namespace app
