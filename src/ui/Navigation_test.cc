#include <gtest/gtest.h>

#include "ui/NavigationController.h"
#include "ui/Storyboard.h"
#include "ui/Window.h"
#include "ui/testing/TestScreens.h"

namespace ui {
namespace {

using testing::DetailScreen;
using testing::MenuScreen;

class ANavigationStack : public ::testing::Test {
 protected:
  ANavigationStack() : board(testing::testStoryboard()) {
    window.setRootViewController(board.instantiateInitialViewController());
    window.makeKeyAndVisible();
  }
  ~ANavigationStack() override { testing::testData() = {}; }

  NavigationController& navigation() {
    return *dynamic_cast<NavigationController*>(window.rootViewController());
  }

  Storyboard board;
  Window window;
};

TEST_F(ANavigationStack, ShowsItsRootScreenLoadedWhenTheWindowIsShown) {
  auto* menu = dynamic_cast<MenuScreen*>(&navigation().topViewController());
  ASSERT_NE(menu, nullptr);
  EXPECT_EQ(menu->loads, 1);
  EXPECT_EQ(menu->title(), "Home");
  EXPECT_EQ(menu->navigationController(), &navigation());
  EXPECT_EQ(menu->tableView().cellForRow({0, 1})->textLabel()->text, "Beta");
}

TEST_F(ANavigationStack, PushesWhatATappedRowLeadsToAfterTheCurrentScreenPreparedIt) {
  ASSERT_TRUE(board.selectRow(navigation(), {0, 1}));

  ASSERT_EQ(navigation().viewControllers().size(), 2u);
  auto* detail = dynamic_cast<DetailScreen*>(&navigation().topViewController());
  ASSERT_NE(detail, nullptr);
  EXPECT_EQ(detail->chosen, "Beta");
  EXPECT_EQ(detail->title(), "Beta");
  EXPECT_TRUE(detail->isViewLoaded());
  EXPECT_EQ(detail->navigationController(), &navigation());
}

TEST_F(ANavigationStack, IgnoresATapOnARowThatIsNotThereOrLeadsNowhere) {
  EXPECT_FALSE(board.selectRow(navigation(), {0, 2}));
  EXPECT_FALSE(board.selectRow(navigation(), {1, 0}));

  testing::testData().detail = {{std::nullopt, {{"a", "1"}}}};
  ASSERT_TRUE(board.selectRow(navigation(), {0, 0}));
  EXPECT_FALSE(board.selectRow(navigation(), {0, 0}));
  EXPECT_EQ(navigation().viewControllers().size(), 2u);
}

TEST_F(ANavigationStack, ShowsTheScreenBelowAgainAfterAPopButNeverPopsItsRoot) {
  ASSERT_TRUE(board.selectRow(navigation(), {0, 0}));
  testing::testData().menu = {"Gamma"};
  EXPECT_TRUE(navigation().popViewController());

  auto& menu = dynamic_cast<MenuScreen&>(navigation().topViewController());
  EXPECT_EQ(menu.tableView().cellForRow({0, 0})->textLabel()->text, "Gamma");
  EXPECT_EQ(menu.loads, 1);
  EXPECT_FALSE(navigation().popViewController());
}

TEST(AStoryboard, RefusesToMakeAnUnknownScene) {
  const Storyboard board = testing::testStoryboard();
  EXPECT_THROW(board.instantiateViewController("Nowhere"), std::out_of_range);
}

TEST(AStoryboard, GivesEachScreenItsOwnCopiesOfThePrototypeCells) {
  const Storyboard board = testing::testStoryboard();
  auto first = board.instantiateViewController("Detail");
  auto& table = dynamic_cast<DetailScreen&>(*first).tableView();
  EXPECT_EQ(table.dequeueReusableCell("DetailCell")->style(), CellStyle::RightDetail);
  EXPECT_THROW(table.dequeueReusableCell("MenuCell"), std::out_of_range);
}

}  // namespace
}  // namespace ui
