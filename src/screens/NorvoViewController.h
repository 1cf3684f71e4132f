#pragma once

#include "ui/TableViewController.h"

// The launch screen: the four radio technologies and the device's identity, one row each.
class NorvoViewController : public ui::TableViewController {
 public:
  std::size_t numberOfSections(ui::TableView& tableView) override;
  std::size_t numberOfRows(ui::TableView& tableView, std::size_t section) override;
  std::shared_ptr<ui::TableViewCell> cellForRow(ui::TableView& tableView,
                                                ui::IndexPath indexPath) override;

  // Hands the tapped row's text to the first-level screen being opened.
  void prepareForSegue(ui::StoryboardSegue& segue, const ui::TableViewCell* sender) override;
};
