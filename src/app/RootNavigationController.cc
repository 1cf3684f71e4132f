#include "app/RootNavigationController.h"

#include "app/SharedIntake.h"
#include "platform/Log.h"

RootNavigationController::RootNavigationController(std::unique_ptr<ui::ViewController> root)
    : RootNavigationController(std::move(root), &TarnWrapper::sharedInstance(), app::sharedIntake(),
                               ui::Bundle::mainBundle()) {}

RootNavigationController::RootNavigationController(std::unique_ptr<ui::ViewController> root,
                                                   TarnWrapper* tarnWrapper,
                                                   store::MetricValidator& metricValidator,
                                                   const ui::Bundle& resources)
    : ui::NavigationController(std::move(root)),
      myTarnWrapper_(tarnWrapper),
      myMetricValidator_(metricValidator),
      resources_(resources) {}

void RootNavigationController::viewDidLoad() {
  ui::NavigationController::viewDidLoad();
  // Results of the removal and the query are not acted on; the session logs their status.
  if (myTarnWrapper_ != nullptr) myTarnWrapper_->removeVelaConfigForAppid(myAppID_);

  const auto path = resources_.pathForResource(metricFileName_, metricFileType_);
  if (!path) {
    platform::log::plain("Metric Log File path doesnt exist");
    return;
  }
  platform::log::plain("pushing metric file");
  if (myTarnWrapper_ == nullptr || !myTarnWrapper_->addVelaConfigForAppId(myAppID_, *path)) return;

  if (store::MetricSession* session = myMetricValidator_.mySharedTarnInstance()) session->listen();
  platform::log::plain("Querying SIM files");
  // Always the service's name for this app, whatever myAppID holds.
  if (myTarnWrapper_ != nullptr)
    myTarnWrapper_->querySpecificMetric(myAppID_, kSimQueryTriggerRef, 0, kSimQueryTriggerID, 0, 0);
}
