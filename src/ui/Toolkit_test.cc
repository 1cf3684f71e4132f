#include <gtest/gtest.h>

#include <optional>
#include <set>

#include "platform/MainQueue.h"
#include "ui/NavigationController.h"
#include "ui/Storyboard.h"
#include "ui/TableView.h"
#include "ui/Timer.h"
#include "ui/Window.h"
#include "ui/testing/TestScreens.h"

namespace ui {
namespace {

using testing::DetailScreen;
using testing::MenuScreen;
using testing::testData;
using namespace std::chrono_literals;

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

bool runFor(std::chrono::milliseconds duration) {
  return platform::runMainQueueUntil([] { return false; }, duration);
}

TEST(ATimer, RepeatsOnTheMainQueueUntilInvalidated) {
  int fired = 0;
  bool onMainQueue = true;
  Timer timer = Timer::scheduledTimer(
      10ms,
      [&] {
        ++fired;
        onMainQueue = onMainQueue && platform::isMainQueue();
      },
      true);
  ASSERT_TRUE(platform::runMainQueueUntil([&] { return fired == 3; }, 2s));
  EXPECT_TRUE(onMainQueue);
  EXPECT_TRUE(timer.isValid());

  timer.invalidate();
  EXPECT_FALSE(timer.isValid());
  runFor(40ms);
  EXPECT_EQ(fired, 3);
}

TEST(ATimer, ThatDoesNotRepeatFiresOnceAndThenIsInvalid) {
  int fired = 0;
  Timer timer = Timer::scheduledTimer(
      5ms, [&] { ++fired; }, false);
  runFor(40ms);
  EXPECT_EQ(fired, 1);
  EXPECT_FALSE(timer.isValid());
}

TEST(ATimer, StopsWhenItsHandleIsDestroyedEvenFromItsOwnAction) {
  int fired = 0;
  std::optional<Timer> timer;
  timer = Timer::scheduledTimer(
      5ms,
      [&] {
        ++fired;
        timer.reset();
      },
      true);
  runFor(40ms);
  EXPECT_EQ(fired, 1);

  {
    Timer gone = Timer::scheduledTimer(
        5ms, [&] { ++fired; }, true);
  }
  runFor(30ms);
  EXPECT_EQ(fired, 1);
}

TEST(ATimer, ThatIsReplacedByAssignmentStops) {
  int old = 0;
  Timer timer = Timer::scheduledTimer(
      5ms, [&] { ++old; }, true);
  timer = Timer::scheduledTimer(
      1h, [] {}, true);
  runFor(30ms);
  EXPECT_EQ(old, 0);
}

}  // namespace
}  // namespace ui
