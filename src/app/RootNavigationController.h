#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "client/TarnWrapper.h"
#include "store/MetricValidator.h"
#include "ui/Bundle.h"
#include "ui/NavigationController.h"

// The window's root: the navigation stack of the screens. Building it takes the shared session
// and the shared intake; its view loading registers the metric configuration with the baseband
// manager, listens, and asks once for the SIM files.
class RootNavigationController : public ui::NavigationController {
 public:
  // The SIM file query asked once at start; a recording session asks it too.
  static constexpr std::int32_t kSimQueryTriggerRef = 9999;
  static constexpr std::int32_t kSimQueryTriggerID = 0x7F0013;

  // With the shared session and intake, and the program's resources.
  explicit RootNavigationController(std::unique_ptr<ui::ViewController> root);
  // `tarnWrapper` may be null: then no command is sent.
  RootNavigationController(std::unique_ptr<ui::ViewController> root, TarnWrapper* tarnWrapper,
                           store::MetricValidator& metricValidator, const ui::Bundle& resources);

  const std::string& myAppID() const { return myAppID_; }
  const std::string& metricFileName() const { return metricFileName_; }
  const std::string& metricFileType() const { return metricFileType_; }
  TarnWrapper* myTarnWrapper() const { return myTarnWrapper_; }
  store::MetricValidator& myMetricValidator() const { return myMetricValidator_; }

 protected:
  void viewDidLoad() override;

 private:
  const std::string myAppID_{TarnWrapper::kAppName};
  const std::string metricFileName_ = "fen_test_lte";
  const std::string metricFileType_ = "deviceconfig";
  TarnWrapper* const myTarnWrapper_;
  store::MetricValidator& myMetricValidator_;
  const ui::Bundle& resources_;
};
