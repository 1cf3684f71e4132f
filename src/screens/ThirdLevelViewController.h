#pragma once

#include <optional>
#include <string>

#include "screens/NorvoViewItems.h"
#include "ui/TableViewController.h"

// Below the detail screen: the choices made above it, and a single row as its prototype shows
// it.
class ThirdLevelViewController : public ui::TableViewController {
 public:
  const std::optional<std::string>& firstSelection() const { return firstSelection_; }
  void setFirstSelection(std::optional<std::string> selection) {
    firstSelection_ = std::move(selection);
  }
  const std::optional<std::string>& secondSelection() const { return secondSelection_; }
  void setSecondSelection(std::optional<std::string> selection) {
    secondSelection_ = std::move(selection);
  }
  const std::optional<std::string>& seguedThroughRow() const { return seguedThroughRow_; }
  void setSeguedThroughRow(std::optional<std::string> row) { seguedThroughRow_ = std::move(row); }

  const NorvoViewItems& tableViewFields() const { return tableViewFields_; }

  std::size_t numberOfSections(ui::TableView& tableView) override;
  std::size_t numberOfRows(ui::TableView& tableView, std::size_t section) override;
  std::shared_ptr<ui::TableViewCell> cellForRow(ui::TableView& tableView,
                                                ui::IndexPath indexPath) override;

 private:
  std::optional<std::string> firstSelection_;
  std::optional<std::string> secondSelection_;
  std::optional<std::string> seguedThroughRow_;
  NorvoViewItems tableViewFields_;
};
