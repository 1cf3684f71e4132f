#include <gtest/gtest.h>

#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "screens/Categories.h"
#include "screens/FirstLevelViewController.h"
#include "screens/NorvoViewController.h"
#include "screens/NorvoViewItems.h"
#include "screens/SecondLevelViewController.h"
#include "ui/StoryboardSegue.h"

namespace {

using platform::Dictionary;
using platform::List;
using Row = std::pair<std::optional<std::string>, std::optional<std::string>>;

struct Section {
  std::optional<std::string> header;
  std::vector<Row> rows;
  bool operator==(const Section&) const = default;
};

std::ostream& operator<<(std::ostream& out, const Section& section) {
  out << "[" << section.header.value_or("(no header)") << ":";
  for (const auto& [text, detail] : section.rows)
    out << " " << text.value_or("(none)") << "=" << detail.value_or("(none)");
  return out << "]";
}

class TheDetailScreen : public ::testing::Test {
 protected:
  TheDetailScreen() {
    screen.tableView().registerPrototype(
        ui::TableViewCell("SecondClickView", ui::CellStyle::RightDetail));
  }

  // What the screen shows for a category after a reload.
  std::vector<Section> show(std::string launch, std::string item) {
    screen.setFirstSelection(std::move(launch));
    screen.setSeguedThroughRow(std::move(item));
    return shown();
  }

  std::vector<Section> shown() {
    screen.tableView().reloadData();
    std::vector<Section> sections;
    for (const auto& section : screen.tableView().sections()) {
      Section& copy = sections.emplace_back(Section{section.header, {}});
      for (const auto& cell : section.cells)
        copy.rows.emplace_back(cell->textLabel()->text, cell->detailTextLabel()->text);
    }
    return sections;
  }

  store::MetricValidator validator{nullptr};
  SecondLevelViewController screen{validator};
};

const std::vector<Section> kComeBackLater{{std::nullopt, {{"Come back later", "Come back later"}}}};

TEST_F(TheDetailScreen, ShowsADisplayDictionaryAsOneRowPerEntryInStoredOrder) {
  EXPECT_EQ(show("LTE", "RRC State"),
            (std::vector<Section>{{std::nullopt, {{std::nullopt, std::nullopt}}}}));

  validator.setMyLTERRCStateDict(Dictionary{{"timestamp", "2024-05-01 10:00:00 UTC"},
                                            {"rrc_state", 42},
                                            {"z_first_alphabetically_last", true},
                                            {"a_power", -10.5f}});
  EXPECT_EQ(shown(), (std::vector<Section>{{std::nullopt,
                                            {{"timestamp", "2024-05-01 10:00:00 UTC"},
                                             {"rrc_state", "42"},
                                             {"z_first_alphabetically_last", "1"},
                                             {"a_power", "-10.5"}}}}));

  validator.setMyLTECDRXConfigDict(Dictionary{});
  EXPECT_EQ(show("LTE", "C-DRX"), (std::vector<Section>{{std::nullopt, {}}}));
}

TEST_F(TheDetailScreen, ComplainsOnlyAboutAMissingLteServingCell) {
  platform::log::Capture log;
  show("LTE", "Serving Cell Info");
  EXPECT_EQ(log.count("You are screwed"), 1u);
  show("UMTS", "Serving Cell Info");
  show("LTE", "RRC State");
  EXPECT_EQ(log.plainLines().size(), 1u);
}

TEST_F(TheDetailScreen, ShowsAReselectionRecordWithItsKeysFromTheStart) {
  const auto lte = show("LTE", "Sel Resel Parameters");
  ASSERT_EQ(lte.size(), 1u);
  ASSERT_EQ(lte[0].rows.size(), 20u);
  EXPECT_EQ(lte[0].rows[9], (Row{"QRxLevMin", ""}));
}

TEST_F(TheDetailScreen, ShowsAListAsOneNumberedSectionPerElement) {
  store::LTE lte = validator.myLTE();
  lte.EutraNbrs =
      List{Dictionary{{"pci", 1}, {"rsrp", -90}}, Dictionary{{"pci", 2}}, Dictionary{{"pci", 3}}};
  lte.CAStatusList = List{Dictionary{{"rssi", -60}}};
  validator.setMyLTE(lte);

  EXPECT_EQ(show("LTE", "EUTRA Neighbor Info"),
            (std::vector<Section>{{"EUTRA Neighbor 0", {{"pci", "1"}, {"rsrp", "-90"}}},
                                  {"EUTRA Neighbor 1", {{"pci", "2"}}},
                                  {"EUTRA Neighbor 2", {{"pci", "3"}}}}));
  EXPECT_EQ(show("LTE", "CA Status"),
            (std::vector<Section>{{"Component Carrier 0", {{"rssi", "-60"}}}}));
  EXPECT_EQ(
      show("LTE", "Tx Power"),
      (std::vector<Section>{{"TxPowerInfo 0", {{"Waiting for Update", "Waiting for Update"}}}}));

  lte.EutraNbrs.clear();
  validator.setMyLTE(lte);
  EXPECT_EQ(show("LTE", "EUTRA Neighbor Info"), std::vector<Section>{});
}

TEST_F(TheDetailScreen, ShowsOnlyTheFirstElementOfTheSimFilesAndServingMeasurements) {
  store::Common common = validator.myCommon();
  common.simContents = List{Dictionary{{"file", "EF_IMSI"}}, Dictionary{{"file", "EF_AD"}}};
  validator.setMyCommon(common);
  EXPECT_EQ(show("Device Info", "SIM Files"),
            (std::vector<Section>{{"SIM Content 0", {{"file", "EF_IMSI"}}}}));

  store::LTE lte = validator.myLTE();
  lte.RsrpRsrqSinr = List{Dictionary{{"rsrp", -100}}, Dictionary{{"rsrp", -101}}};
  validator.setMyLTE(lte);
  EXPECT_EQ(show("LTE", "Serving Cell Meas"),
            (std::vector<Section>{{std::nullopt, {{"rsrp", "-100"}}}}));

  lte.RsrpRsrqSinr.clear();
  validator.setMyLTE(lte);
  EXPECT_EQ(show("LTE", "Serving Cell Meas"), (std::vector<Section>{{std::nullopt, {}}}));
}

TEST_F(TheDetailScreen, AsksToComeBackLaterForCategoriesWithoutData) {
  for (const auto& [launch, item] :
       {std::pair{"Device Info", "IMSI"}, {"LTE", "Nonsense"}, {"lte", "C-DRX"}})
    EXPECT_EQ(show(launch, item), kComeBackLater) << launch << " " << item;

  SecondLevelViewController unchosen(validator);
  unchosen.tableView().registerPrototype(
      ui::TableViewCell("SecondClickView", ui::CellStyle::RightDetail));
  unchosen.tableView().reloadData();
  EXPECT_EQ(unchosen.tableView().cellForRow({0, 0})->textLabel()->text, "Come back later");
}

TEST_F(TheDetailScreen, ShowsNothingForRowsTheStoreNoLongerHas) {
  show("LTE", "EUTRA Neighbor Info");
  ui::TableView& table = screen.tableView();
  EXPECT_EQ(screen.numberOfRows(table, 7), 0u);
  EXPECT_EQ(screen.cellForRow(table, {7, 0})->textLabel()->text, std::nullopt);
  EXPECT_EQ(screen.cellForRow(table, {0, 5})->textLabel()->text, std::nullopt);

  store::LTE lte = validator.myLTE();
  lte.EutraNbrs = List{"not a dictionary"};
  validator.setMyLTE(lte);
  EXPECT_EQ(shown(), (std::vector<Section>{{"EUTRA Neighbor 0", {}}}));
}

TEST_F(TheDetailScreen, ReloadsOnTheMainQueueWhenUpdated) {
  show("LTE", "C-DRX");
  validator.setMyLTECDRXConfigDict(Dictionary{{"on_duration_timer", 8}});
  const std::size_t reloads = screen.tableView().reloadCount();
  screen.update();
  EXPECT_EQ(screen.tableView().reloadCount(), reloads);

  ASSERT_TRUE(platform::runMainQueueUntil(
      [&] { return screen.tableView().reloadCount() > reloads; }, std::chrono::seconds(2)));
  EXPECT_EQ(screen.tableView().cellForRow({0, 0})->detailTextLabel()->text, "8");
}

TEST_F(TheDetailScreen, ThatIsGoneIgnoresTheReloadItQueued) {
  auto gone = std::make_unique<SecondLevelViewController>(validator);
  gone->update();
  gone.reset();
  bool ran = false;
  platform::postToMainQueue([&] { ran = true; });
  EXPECT_TRUE(platform::runMainQueueUntil([&] { return ran; }, std::chrono::seconds(2)));
}

// The menus hand over the texts of the tapped rows.
class TheMenus : public ::testing::Test {
 protected:
  TheMenus() {
    launch.tableView().registerPrototype(ui::TableViewCell("LaunchView", ui::CellStyle::Basic));
    first.tableView().registerPrototype(ui::TableViewCell("FirstClickView", ui::CellStyle::Basic));
    launch.tableView().reloadData();
  }

  static std::vector<std::string> texts(const ui::TableView& table) {
    std::vector<std::string> shown;
    for (const auto& section : table.sections())
      for (const auto& cell : section.cells)
        shown.push_back(cell->textLabel()->text.value_or(""));
    return shown;
  }

  store::MetricValidator validator{nullptr};
  NorvoViewController launch;
  FirstLevelViewController first{validator};
  SecondLevelViewController detail{validator};
};

TEST_F(TheMenus, ListTheLaunchItemsAndThenTheCategoriesOfTheTappedOne) {
  EXPECT_EQ(launch.tableView().sections().size(), 1u);
  EXPECT_EQ(texts(launch.tableView()),
            (std::vector<std::string>{"Device Info", "LTE", "UMTS", "GSM"}));

  ui::StoryboardSegue toFirst("ShowFirstLevel", launch, first);
  launch.prepareForSegue(toFirst, launch.tableView().cellForRow({0, 2}).get());
  EXPECT_EQ(first.seguedThroughRow(), "UMTS");
  first.tableView().reloadData();
  const auto umts = texts(first.tableView());
  ASSERT_EQ(umts.size(), 15u);
  EXPECT_EQ((std::vector<std::string>(umts.begin(), umts.begin() + 3)),
            (std::vector<std::string>{"NAS GMM", "NAS MM", "RRC State"}));
}

TEST_F(TheMenus, HandTheLaunchItemAndTheTappedCategoryToTheDetailScreen) {
  first.setSeguedThroughRow("GSM");
  first.tableView().reloadData();
  ui::StoryboardSegue toDetail("ShowDetail", first, detail);
  first.prepareForSegue(toDetail, first.tableView().cellForRow({0, 3}).get());
  EXPECT_EQ(detail.firstSelection(), "GSM");
  EXPECT_EQ(detail.seguedThroughRow(), "Idle Config");
}

TEST_F(TheMenus, PassNothingToAScreenOfAnotherKindOrWithoutATappedCell) {
  ui::StoryboardSegue wrongKind("Other", launch, detail);
  launch.prepareForSegue(wrongKind, launch.tableView().cellForRow({0, 1}).get());
  EXPECT_EQ(detail.seguedThroughRow(), std::nullopt);
  EXPECT_EQ(detail.firstSelection(), std::nullopt);

  ui::StoryboardSegue noSender("ShowFirstLevel", launch, first);
  launch.prepareForSegue(noSender, nullptr);
  EXPECT_EQ(first.seguedThroughRow(), std::nullopt);
}

// The detail screen dispatches on the texts of the menus, so a typo on either side would leave a
// category showing "Come back later".
TEST(TheMenuTexts, NameACategoryWithDataForEveryItemButTheTwoIdentities) {
  const NorvoViewItems items;
  std::size_t keys = 0;
  for (const std::string& launch : items.launchViewItemNames())
    for (const std::string& item : items.firstLevelViewItems().at(launch)) {
      std::string key = launch;
      key.append(" ").append(item);
      ++keys;
      const bool identity = key == "Device Info IMSI" || key == "Device Info IMEISV";
      EXPECT_EQ(screens::categoryFor(key) == nullptr, identity) << key;
    }
  EXPECT_EQ(keys, 43u);
}

}  // namespace
