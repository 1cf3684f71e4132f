#include "ui/TableView.h"

#include <gtest/gtest.h>

#include <set>

#include "ui/testing/TestScreens.h"

namespace ui {
namespace {

using testing::DetailScreen;
using testing::testData;

class ATableView : public ::testing::Test {
 protected:
  ATableView() {
    screen.tableView().registerPrototype(TableViewCell("DetailCell", CellStyle::RightDetail));
    testData().detail = {{"First", {{"a", "1"}, {"b", "2"}}}, {std::nullopt, {{"c", "3"}}}};
  }
  ~ATableView() override { testData() = {}; }

  DetailScreen screen;
};

TEST_F(ATableView, ShowsWhatItsDataSourceAnsweredAtTheLatestReload) {
  TableView& table = screen.tableView();
  EXPECT_TRUE(table.sections().empty());
  table.reloadData();

  ASSERT_EQ(table.sections().size(), 2u);
  EXPECT_EQ(table.sections()[0].header, "First");
  EXPECT_EQ(table.sections()[1].header, std::nullopt);
  EXPECT_EQ(table.cellForRow({0, 1})->detailTextLabel()->text, "2");
  EXPECT_EQ(table.cellForRow({1, 0})->textLabel()->text, "c");
  EXPECT_EQ(table.cellForRow({1, 1}), nullptr);
  EXPECT_EQ(table.cellForRow({2, 0}), nullptr);
  EXPECT_EQ(table.reloadCount(), 1u);
}

TEST_F(ATableView, ReusesTheCellsOfThePreviousReloadResetToTheirPrototype) {
  TableView& table = screen.tableView();
  table.reloadData();
  std::set<const TableViewCell*> before;
  for (const auto& section : table.sections())
    for (const auto& cell : section.cells)
      before.insert(cell.get());

  // A row that sets no label must not show what its reused cell showed before.
  testData().detail = {{std::nullopt, {{std::nullopt, std::nullopt}, {"d", "4"}}}};
  table.reloadData();

  const auto blank = table.cellForRow({0, 0});
  EXPECT_TRUE(before.contains(blank.get()));
  EXPECT_TRUE(before.contains(table.cellForRow({0, 1}).get()));
  EXPECT_EQ(blank->textLabel()->text, std::nullopt);
  EXPECT_EQ(blank->detailTextLabel()->text, std::nullopt);
}

TEST_F(ATableView, RefusesAnIdentifierWithoutAPrototype) {
  EXPECT_THROW(screen.tableView().dequeueReusableCell("Nope"), std::out_of_range);
}

TEST_F(ATableView, IsLeftEmptyWhenItsDataSourceFailsMidReload) {
  TableView& table = screen.tableView();
  table.reloadData();
  testData().failNextReload = true;
  EXPECT_THROW(table.reloadData(), std::runtime_error);
  EXPECT_TRUE(table.sections().empty());

  table.reloadData();
  EXPECT_EQ(table.sections().size(), 2u);
}

}  // namespace
}  // namespace ui
