#include "screens/NorvoViewItems.h"

#include <gtest/gtest.h>

#include "screens/Categories.h"

namespace {

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
