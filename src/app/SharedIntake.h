#pragma once

#include <memory>

#include "client/TarnWrapper.h"
#include "store/MetricSession.h"
#include "store/MetricValidator.h"

namespace app {

// A session of the app, as the intake sees it; `session` must outlive it.
class TarnWrapperSession final : public store::MetricSession {
 public:
  explicit TarnWrapperSession(TarnWrapper& session) : session_(session) {}

  void listen() override { session_.listen(); }
  void setDelegate(std::weak_ptr<TarnWrapperDelegate> delegate) override;

 private:
  TarnWrapper& session_;
};

// The shared intake, wired to the shared session on first use: the intake listens on
// TarnWrapper::sharedInstance() and is its delegate from then on. The app takes the intake from
// here rather than from MetricValidator::sharedInstance(), which knows no session by itself.
store::MetricValidator& sharedIntake();

}  // namespace app
