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
//       the timeline page, linked from the launch screen
class ViewerEvents {
 public:
  // Observes `intake` from now on; both live on the main queue.
  explicit ViewerEvents(store::MetricValidator& intake);
  ViewerEvents(const ViewerEvents&) = delete;
  ViewerEvents& operator=(const ViewerEvents&) = delete;

  void addPages(ui::DisplayOptions& display);

  // Forgets every event and what the detectors remember, as before the first metric.
  void reset();

  events::EventRing& ring() { return ring_; }

 private:
  ui::web::Site::QueryAnswer eventsApi(const ui::web::QueryParameters& parameters) const;
  ui::web::Site::QueryAnswer metricApi(const ui::web::QueryParameters& parameters) const;

  events::EventRing ring_;
  events::EventDetector detector_{ring_};
};

}  // namespace app
