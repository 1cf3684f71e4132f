#include "app/MainInterface.h"

#include <gtest/gtest.h>

#include <boost/json/parse.hpp>

#include "ui/web/OpenPages.h"
#include "ui/web/Site.h"

namespace {

namespace http = ui::web::http;
namespace json = boost::json;
using platform::Dictionary;
using platform::List;

// Browses the real screens the way a browser does, over a store of the test's own.
class TheBrowser : public ::testing::Test {
 protected:
  ui::web::Response get(const std::string& target) {
    ui::web::Request request(http::verb::get, target, 11);
    request.set(http::field::host, "127.0.0.1:8080");
    return site.handle(request);
  }

  bool shows(const std::string& target, std::string_view html) {
    return get(target).body().find(html) != std::string::npos;
  }

  store::MetricValidator validator{nullptr};
  ui::Storyboard board = mainInterface(&validator);
  ui::web::OpenPages pages{board, {}};
  ui::web::Site site{pages, {}};
};

TEST_F(TheBrowser, ShowsTheCarriersOfTheCaStatusAsNumberedSections) {
  store::LTE lte = validator.myLTE();
  lte.CAStatusList = List{Dictionary{{"rsrp", -95}, {"dl_bandwidth", 20.0f}},
                          Dictionary{{"rsrp", -101}, {"dl_bandwidth", 1.4f}}};
  validator.setMyLTE(lte);

  EXPECT_TRUE(shows("/LTE/CA%20Status", "<h2>Component Carrier 1</h2>"));
  const json::value table = json::parse(get("/api/screens/LTE/CA%20Status").body());
  EXPECT_EQ(table.at("title"), "CA Status");
  EXPECT_EQ(table.at("sections").at(0).at("header"), "Component Carrier 0");
  EXPECT_EQ(table.at("sections").at(0).at("rows").at(1),
            (json::value{{"text", "dl_bandwidth"}, {"detail", "20.0"}}));
  EXPECT_EQ(table.at("sections").at(1).at("rows").at(1).at("detail"), "1.4");
}

// The launch screen, the categories and the identities' rows are walked in a browser by
// tests/browser/browse.test.js.
TEST_F(TheBrowser, FindsEachItemUnderItsOwnCategoryAndTheThirdLevelByAddress) {
  EXPECT_TRUE(shows("/GSM", R"(<a href="/GSM/GSM%20GPRS%20Config">)"));
  EXPECT_EQ(get("/LTE/GSM%20GPRS%20Config").result(), http::status::not_found);
  // Detail rows are not links, but each leads to the third level.
  EXPECT_FALSE(shows("/Device%20Info/IMSI", "<a href=\"/Device%20Info/IMSI/"));
  EXPECT_TRUE(shows("/Device%20Info/IMSI/Come%20back%20later", "No further details"));
}

}  // namespace
