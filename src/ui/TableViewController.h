#pragma once

#include <memory>

#include "ui/TableView.h"
#include "ui/ViewController.h"

namespace ui {

// A screen that is one table and answers its table's questions itself. The table reloads each
// time the screen is shown.
class TableViewController : public ViewController, public TableViewDataSource {
 public:
  ~TableViewController() override;

  TableView& tableView() { return *tableView_; }
  const TableView& tableView() const { return *tableView_; }

  // The table, for work queued to run later: it may be gone by then.
  std::weak_ptr<TableView> weakTableView() const { return tableView_; }

 protected:
  TableViewController();

  void viewWillAppear() override;

 private:
  std::shared_ptr<TableView> tableView_;
};

}  // namespace ui
