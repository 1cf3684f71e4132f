#pragma once

#include <optional>
#include <string>

#include "screens/NorvoViewItems.h"
#include "store/MetricValidator.h"
#include "ui/TableViewController.h"

// The categories of one launch item (a radio technology, or the device's identity).
class FirstLevelViewController : public ui::TableViewController {
 public:
  explicit FirstLevelViewController(
      store::MetricValidator& validator = store::MetricValidator::sharedInstance());

  // The launch item chosen on the launch screen.
  const std::optional<std::string>& seguedThroughRow() const { return seguedThroughRow_; }
  void setSeguedThroughRow(std::optional<std::string> row) { seguedThroughRow_ = std::move(row); }

  const NorvoViewItems& tableViewFields() const { return tableViewFields_; }
  store::MetricValidator& myMetricValidator() const { return myMetricValidator_; }

  std::size_t numberOfSections(ui::TableView& tableView) override;
  // None when the chosen launch item is not one of the launch items.
  std::size_t numberOfRows(ui::TableView& tableView, std::size_t section) override;
  std::shared_ptr<ui::TableViewCell> cellForRow(ui::TableView& tableView,
                                                ui::IndexPath indexPath) override;

  // Hands the launch item and the tapped row's text to the detail screen being opened.
  void prepareForSegue(ui::StoryboardSegue& segue, const ui::TableViewCell* sender) override;

 private:
  const std::vector<std::string>* items() const;

  std::optional<std::string> seguedThroughRow_;
  NorvoViewItems tableViewFields_;
  store::MetricValidator& myMetricValidator_;
};
