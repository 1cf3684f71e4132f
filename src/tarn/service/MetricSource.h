#pragma once

#include <cstdint>
#include <functional>
#include <optional>

#include "platform/Value.h"

namespace tarn::service {

struct Metric {
  std::uint32_t metricId;   // full metric ID, e.g. 0x3CD313
  platform::Bytes payload;  // one encoded record
};

// Produces the metrics a baseband delivers, on its own schedule.
class MetricSource {
 public:
  virtual ~MetricSource() = default;
  // Starts producing; `deliver` may be called from any one thread the source owns, in delivery
  // order. `deliver` may wait a little when the receivers fall behind, so the source must not
  // hold a lock that query() or stop() take while it calls it.
  virtual void start(std::function<void(Metric)> deliver) = 0;
  // Stops producing; no `deliver` call runs after stop() returns.
  virtual void stop() = 0;
  // The metric that answers a query, if the source has one (the SIM files for 0x3C0013).
  virtual std::optional<Metric> query(std::uint32_t metricId) = 0;
  // Whether the service should start the source only once a session subscribes to metrics: a
  // recorded drive plays from its first metric to its first subscriber, while a live baseband
  // runs regardless.
  virtual bool startsWithFirstListener() const { return false; }
};

}  // namespace tarn::service
