#include "ui/testing/TestScreens.h"

#include <stdexcept>

#include "ui/StoryboardSegue.h"

namespace ui::testing {

TestData& testData() {
  static TestData data;
  return data;
}

std::size_t MenuScreen::numberOfRows(TableView&, std::size_t) {
  return testData().menu.size();
}

std::shared_ptr<TableViewCell> MenuScreen::cellForRow(TableView& tableView, IndexPath indexPath) {
  auto cell = tableView.dequeueReusableCell("MenuCell");
  cell->textLabel()->text = testData().menu.at(indexPath.row);
  return cell;
}

void MenuScreen::prepareForSegue(StoryboardSegue& segue, const TableViewCell* sender) {
  auto* detail = dynamic_cast<DetailScreen*>(&segue.destinationViewController());
  if (detail != nullptr && sender != nullptr) detail->chosen = sender->textLabel()->text;
}

std::size_t DetailScreen::numberOfSections(TableView&) {
  if (std::exchange(testData().failNextReload, false)) throw std::runtime_error("store is gone");
  return testData().detail.size();
}

std::size_t DetailScreen::numberOfRows(TableView&, std::size_t section) {
  return testData().detail.at(section).rows.size();
}

std::optional<std::string> DetailScreen::titleForHeader(TableView&, std::size_t section) {
  return testData().detail.at(section).header;
}

std::shared_ptr<TableViewCell> DetailScreen::cellForRow(TableView& tableView, IndexPath indexPath) {
  auto cell = tableView.dequeueReusableCell("DetailCell");
  const TestRow& row = testData().detail.at(indexPath.section).rows.at(indexPath.row);
  if (row.name) cell->textLabel()->text = row.name;
  if (row.value) cell->detailTextLabel()->text = row.value;
  return cell;
}

Storyboard testStoryboard() {
  Storyboard board(
      [](std::unique_ptr<ViewController> root) {
        return std::make_unique<NavigationController>(std::move(root));
      },
      "Menu");
  board.addScene(
      {"Menu",
       [] { return std::make_unique<MenuScreen>(); },
       "Home",
       {TableViewCell("MenuCell", CellStyle::Basic, CellAccessory::DisclosureIndicator)}});
  board.addScene({"Detail",
                  [] { return std::make_unique<DetailScreen>(); },
                  std::nullopt,
                  {TableViewCell("DetailCell", CellStyle::RightDetail)}});
  board.addSegue({"ShowDetail", "MenuCell", "Detail"});
  return board;
}

}  // namespace ui::testing
