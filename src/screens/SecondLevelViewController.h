#pragma once

#include <memory>
#include <optional>
#include <string>

#include "screens/Categories.h"
#include "screens/NorvoViewItems.h"
#include "store/MetricValidator.h"
#include "ui/TableViewCell.h"
#include "ui/TableViewController.h"
#include "ui/Timer.h"

// The detail screen: one category of measured data as rows of name and value, read afresh from
// the store at every reload. It reloads every 5 seconds while it is on the navigation stack.
class SecondLevelViewController : public ui::TableViewController {
 public:
  explicit SecondLevelViewController(
      store::MetricValidator& validator = store::MetricValidator::sharedInstance());

  // The launch item chosen two screens up.
  const std::optional<std::string>& firstSelection() const { return firstSelection_; }
  void setFirstSelection(std::optional<std::string> selection) {
    firstSelection_ = std::move(selection);
  }
  // The category chosen on the first-level screen.
  const std::optional<std::string>& seguedThroughRow() const { return seguedThroughRow_; }
  void setSeguedThroughRow(std::optional<std::string> row) { seguedThroughRow_ = std::move(row); }
  const std::shared_ptr<ui::TableViewCell>& currentCell() const { return currentCell_; }
  void setCurrentCell(std::shared_ptr<ui::TableViewCell> cell) { currentCell_ = std::move(cell); }

  const NorvoViewItems& tableViewFields() const { return tableViewFields_; }
  store::MetricValidator& myMetricValidator() const { return myMetricValidator_; }

  std::size_t numberOfSections(ui::TableView& tableView) override;
  std::optional<std::string> titleForHeader(ui::TableView& tableView, std::size_t section) override;
  std::size_t numberOfRows(ui::TableView& tableView, std::size_t section) override;
  std::shared_ptr<ui::TableViewCell> cellForRow(ui::TableView& tableView,
                                                ui::IndexPath indexPath) override;

  // The refresh timer's action: queues a reload of the table on the main queue.
  void update();

 protected:
  void viewDidLoad() override;

 private:
  // "LTE" and "CA Status" give "LTE CA Status"; none while either is missing.
  std::optional<std::string> categoryKey() const;
  const screens::Category* category() const;
  // The entries that section `section` shows as rows, if any.
  const platform::Dictionary* entries(const screens::Category& category, std::size_t section) const;

  NorvoViewItems tableViewFields_;
  std::optional<std::string> firstSelection_;
  std::optional<std::string> seguedThroughRow_;
  std::shared_ptr<ui::TableViewCell> currentCell_;
  store::MetricValidator& myMetricValidator_;
  ui::Timer refreshTimer_;
};
