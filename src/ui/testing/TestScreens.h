#pragma once

#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "ui/Storyboard.h"
#include "ui/TableViewController.h"

// A small app for the toolkit's tests: a menu whose rows lead to a detail screen that shows
// whatever `TestData` holds at the time of each reload.
namespace ui::testing {

struct TestRow {
  std::optional<std::string> name;
  std::optional<std::string> value;
};

struct TestSection {
  std::optional<std::string> header;
  std::vector<TestRow> rows;
};

struct TestData {
  std::vector<std::string> menu{"Alpha", "Beta"};
  std::vector<TestSection> detail;
  bool failNextReload = false;
};

TestData& testData();

class MenuScreen : public TableViewController {
 public:
  std::size_t numberOfSections(TableView&) override { return 1; }
  std::size_t numberOfRows(TableView&, std::size_t) override;
  std::shared_ptr<TableViewCell> cellForRow(TableView& tableView, IndexPath indexPath) override;
  void prepareForSegue(StoryboardSegue& segue, const TableViewCell* sender) override;

  int loads = 0;

 protected:
  void viewDidLoad() override { ++loads; }
};

class DetailScreen : public TableViewController {
 public:
  std::size_t numberOfSections(TableView&) override;
  std::size_t numberOfRows(TableView&, std::size_t section) override;
  std::optional<std::string> titleForHeader(TableView&, std::size_t section) override;
  std::shared_ptr<TableViewCell> cellForRow(TableView& tableView, IndexPath indexPath) override;

  // Set by the menu from the tapped row.
  std::optional<std::string> chosen;
};

// "Menu" (root, titled "Home", cells "MenuCell" lead to "Detail") and "Detail" (cells
// "DetailCell" lead nowhere).
Storyboard testStoryboard();

}  // namespace ui::testing
