#pragma once

#include <cstdint>
#include <vector>

#include "events/Detectors.h"
#include "events/EventRing.h"
#include "platform/Value.h"

namespace store {
class MetricValidator;
}

namespace events {

// Runs the detectors over each metric the intake accepts and keeps the events they find in a
// ring. Lives on the main queue with the intake.
class EventDetector {
 public:
  explicit EventDetector(EventRing& ring) : ring_(ring) {}

  // One accepted metric: its ID, its payload (may be none) and its display dictionary as
  // decoded, before the intake's conversions. Events take the record's "timestamp"; a record
  // without one takes the time of the metric before it.
  void observe(std::int64_t metricID, const platform::Bytes* payload,
               const platform::Dictionary& decoded);

  // Observes every metric `intake` accepts from now on; the intake must not outlive this.
  void watch(store::MetricValidator& intake);

  // Forgets what the detectors remember, as if no metric had come yet. The ring is its owner's.
  void reset();

 private:
  EventRing& ring_;
  Memory memory_;
  std::int64_t lastTimeMs_ = 0;
  std::vector<Draft> drafts_;
};

}  // namespace events
