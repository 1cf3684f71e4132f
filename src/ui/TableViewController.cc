#include "ui/TableViewController.h"

namespace ui {

TableViewController::TableViewController() : tableView_(std::make_shared<TableView>()) {
  tableView_->setDataSource(this);
}

TableViewController::~TableViewController() {
  tableView_->setDataSource(nullptr);
}

void TableViewController::viewWillAppear() {
  tableView_->reloadData();
}

}  // namespace ui
