#include "screens/NorvoViewItems.h"

#include <gtest/gtest.h>

#include "screens/Categories.h"

namespace {

TEST(NorvoViewItems, ListsTheLaunchItemsAndTheirCategoriesInDisplayOrder) {
  const NorvoViewItems items;
  EXPECT_EQ(items, NorvoViewItems::shared());
  EXPECT_EQ(items.launchViewItemNames(),
            (std::vector<std::string>{"Device Info", "LTE", "UMTS", "GSM"}));

  const auto& lists = items.firstLevelViewItems();
  ASSERT_EQ(lists.size(), 4u);
  EXPECT_EQ(lists.at("Device Info"), (std::vector<std::string>{"IMSI", "IMEISV", "SIM Files"}));
  EXPECT_EQ(lists.at("LTE").size(), 14u);
  EXPECT_EQ(lists.at("UMTS").size(), 15u);
  EXPECT_EQ(lists.at("GSM").size(), 11u);
  EXPECT_EQ(lists.at("UMTS")[2], "RRC State");
  EXPECT_EQ(lists.at("GSM")[6], "GSM GPRS Config");
  EXPECT_EQ(lists.at("LTE").back(), "Active Bearers");
}

// The detail screen dispatches on the texts of the menus, so a typo on either side would leave a
// category showing "Come back later".
TEST(NorvoViewItems, NameACategoryWithDataForEveryItemButTheTwoIdentities) {
  const NorvoViewItems items;
  std::size_t keys = 0;
  for (const std::string& launch : items.launchViewItemNames())
    for (const std::string& item : items.firstLevelViewItems().at(launch)) {
      const std::string key = launch + " " + item;
      ++keys;
      const bool identity = key == "Device Info IMSI" || key == "Device Info IMEISV";
      EXPECT_EQ(screens::categoryFor(key) == nullptr, identity) << key;
    }
  EXPECT_EQ(keys, 43u);
}

}  // namespace
