#include "screens/ThirdLevelViewController.h"

std::size_t ThirdLevelViewController::numberOfSections(ui::TableView&) {
  return 1;
}

std::size_t ThirdLevelViewController::numberOfRows(ui::TableView&, std::size_t) {
  return 1;
}

std::shared_ptr<ui::TableViewCell> ThirdLevelViewController::cellForRow(ui::TableView& tableView,
                                                                        ui::IndexPath) {
  return tableView.dequeueReusableCell("ThirdClickView");
}
