#pragma once

#include "events/EventDetector.h"
#include "events/EventRing.h"
#include "store/MetricValidator.h"
#include "ui/Application.h"

namespace app {

// The events of the running viewer: found in every metric the intake accepts, kept in a ring,
// and served to browsers:
//
//   GET /api/events?since=MS&kind=K,K&severity=S,S&after=ID&limit=N
//       {"epoch": E, "next_id": N, "events": [...newest first]}; 400 for a malformed query
//   GET /api/events/metric?id=ID
//       the metric behind one event, decoded: {"id", "metric_id", "metric_id_hex", "decoded"}
//   GET /timeline
//       the timeline page
class ViewerEvents {
 public:
  // Observes `intake` from now on; both live on the main queue.
  explicit ViewerEvents(store::MetricValidator& intake);
  ViewerEvents(const ViewerEvents&) = delete;
  ViewerEvents& operator=(const ViewerEvents&) = delete;

  void addRoutes(ui::DisplayOptions& display);

  // Forgets every event and what the detectors remember, as before the first metric.
  void reset();

  events::EventRing& ring() { return ring_; }

 private:
  ui::web::Response eventsApi(const ui::web::Request& request) const;
  ui::web::Response metricApi(const ui::web::Request& request) const;

  events::EventRing ring_;
  events::EventDetector detector_{ring_};
};

}  // namespace app
