#pragma once

#include <optional>
#include <string>

#include "alerts/AlertMonitor.h"
#include "app/RecordClock.h"
#include "store/MetricValidator.h"
#include "ui/Timer.h"

namespace app {

// The rules of `--alerts FILE`, or else of the user's own file, or else the built-in ones. Each
// fault of a file is said on standard error with its line, and Norvo then starts with the
// built-in rules.
std::vector<alerts::AlertRule> viewerAlertRules(const std::optional<std::string>& file);

// The alerts of the running viewer: watched after each metric that changed the store, at the
// record's time, and once a second by the wall clock for silence in a live session. Their events
// go to the viewer's ring; those active show as the banner of every page.
class ViewerAlerts {
 public:
  // Observes `intake` from now on; make it after whatever fills the series it reads, so that it
  // sees each metric's samples.
  ViewerAlerts(std::vector<alerts::AlertRule> rules, alerts::SeriesReader read,
               store::MetricValidator& intake, const RecordClock& recordTime,
               events::EventRing& ring, bool live);
  ViewerAlerts(const ViewerAlerts&) = delete;
  ViewerAlerts& operator=(const ViewerAlerts&) = delete;

  platform::List active() const { return monitor_.active(); }
  void reset();

 private:
  alerts::AlertMonitor monitor_;
  ui::Timer clock_;
};

}  // namespace app
