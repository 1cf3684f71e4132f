#pragma once

#include <memory>

#include "client/TarnWrapperDelegate.h"

namespace store {

// The session that the intake takes its metrics from, as the intake sees it. The app hands the
// shared one over (MetricValidator::setSharedSession), so the store knows no session of its own.
class MetricSession {
 public:
  virtual ~MetricSession() = default;

  // Registers the event and metric handlers and switches events off and on.
  virtual void listen() = 0;
  // The session holds its delegate weakly.
  virtual void setDelegate(std::weak_ptr<TarnWrapperDelegate> delegate) = 0;
};

}  // namespace store
