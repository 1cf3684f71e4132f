#include "app/SharedIntake.h"

#include <utility>

namespace app {

void TarnWrapperSession::setDelegate(std::weak_ptr<TarnWrapperDelegate> delegate) {
  session_.setDelegate(std::move(delegate));
}

store::MetricValidator& sharedIntake() {
  static const bool wired = [] {
    // Never released, like the two shared objects it joins.
    store::MetricValidator::setSharedSession(new TarnWrapperSession(TarnWrapper::sharedInstance()));
    return true;
  }();
  (void)wired;
  return store::MetricValidator::sharedInstance();
}

}  // namespace app
