#pragma once

#include "platform/Value.h"

// Receives what the baseband manager service delivers, always on the main queue: the delegate of
// the app's session (client/TarnWrapper). It lives beside the client library rather than beside
// the session, so that a receiver such as the metric intake needs to know no session.
class TarnWrapperDelegate {
 public:
  virtual ~TarnWrapperDelegate() = default;

  // One delivered metric: "kKeyMetricID", "kKeyPayload", "kKeyProfileID" and "kKeyAppID".
  virtual void metricsDidUpdate(const platform::Dictionary& metric) = 0;
  // One delivered trigger event.
  virtual void eventsDidUpdate(const platform::Dictionary& event) = 0;
};
