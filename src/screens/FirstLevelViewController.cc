#include "screens/FirstLevelViewController.h"

#include "screens/SecondLevelViewController.h"
#include "ui/StoryboardSegue.h"

FirstLevelViewController::FirstLevelViewController(store::MetricValidator& validator)
    : myMetricValidator_(validator) {}

std::size_t FirstLevelViewController::numberOfSections(ui::TableView&) {
  return 1;
}

std::size_t FirstLevelViewController::numberOfRows(ui::TableView&, std::size_t) {
  const std::vector<std::string>* names = items();
  return names != nullptr ? names->size() : 0;
}

std::shared_ptr<ui::TableViewCell> FirstLevelViewController::cellForRow(ui::TableView& tableView,
                                                                        ui::IndexPath indexPath) {
  auto cell = tableView.dequeueReusableCell("FirstClickView");
  const std::vector<std::string>* names = items();
  if (ui::Label* label = cell->textLabel();
      label && names != nullptr && indexPath.row < names->size())
    label->text = (*names)[indexPath.row];
  return cell;
}

void FirstLevelViewController::prepareForSegue(ui::StoryboardSegue& segue,
                                               const ui::TableViewCell* sender) {
  auto* destination = dynamic_cast<SecondLevelViewController*>(&segue.destinationViewController());
  if (sender == nullptr || destination == nullptr) return;
  destination->setFirstSelection(seguedThroughRow_);
  destination->setSeguedThroughRow(sender->textLabel()->text);
}

const std::vector<std::string>* FirstLevelViewController::items() const {
  if (!seguedThroughRow_) return nullptr;
  const auto& lists = tableViewFields_.firstLevelViewItems();
  const auto found = lists.find(*seguedThroughRow_);
  return found != lists.end() ? &found->second : nullptr;
}
