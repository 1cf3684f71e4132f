#pragma once

#include "platform/Value.h"

// Receives what the baseband manager service delivers, always on the main queue.
class TarnWrapperDelegate {
 public:
  virtual ~TarnWrapperDelegate() = default;

  // One delivered metric: "kKeyMetricID", "kKeyPayload", "kKeyProfileID" and "kKeyAppID".
  virtual void metricsDidUpdate(const platform::Dictionary& metric) = 0;
  // One delivered trigger event.
  virtual void eventsDidUpdate(const platform::Dictionary& event) = 0;
};
