#include "screens/NorvoViewController.h"

#include "screens/FirstLevelViewController.h"
#include "screens/NorvoViewItems.h"
#include "ui/StoryboardSegue.h"

std::size_t NorvoViewController::numberOfSections(ui::TableView&) {
  return 1;
}

std::size_t NorvoViewController::numberOfRows(ui::TableView&, std::size_t) {
  return NorvoViewItems::shared().launchViewItemNames().size();
}

std::shared_ptr<ui::TableViewCell> NorvoViewController::cellForRow(ui::TableView& tableView,
                                                                   ui::IndexPath indexPath) {
  auto cell = tableView.dequeueReusableCell("LaunchView");
  const auto& names = NorvoViewItems::shared().launchViewItemNames();
  if (ui::Label* label = cell->textLabel(); label && indexPath.row < names.size())
    label->text = names[indexPath.row];
  return cell;
}

void NorvoViewController::prepareForSegue(ui::StoryboardSegue& segue,
                                          const ui::TableViewCell* sender) {
  auto* destination = dynamic_cast<FirstLevelViewController*>(&segue.destinationViewController());
  if (sender == nullptr || destination == nullptr) return;
  destination->setSeguedThroughRow(sender->textLabel()->text);
}
