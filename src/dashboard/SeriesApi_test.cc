#include "dashboard/SeriesApi.h"

#include <gtest/gtest.h>

#include <boost/json/parse.hpp>

#include "messages/Records.h"
#include "store/StoreTesting.h"

namespace dashboard {
namespace {

namespace json = boost::json;
namespace http = ui::web::http;

class SeriesApiTest : public store::fixtures::StoreTest {
 protected:
  SeriesApiTest() {
    validator.addStoreObserver(
        [this](store::DisplayDictionary replaced, const store::MetricValidator& intake) {
          series.storeDidUpdate(replaced, intake);
        });
    // Three GSM levels, at now - 2000, now - 1000 and now.
    for (const int level : {-80, -75, -70}) {
      messages::KCellularGsmIdleScellMeasurement idle;
      idle.setIdleRxlevDBm(level);
      deliver(store::MetricValidator::K_GSM_IDLE_SCELL_MEAS, idle);
      clock += 1000;
    }
    clock -= 1000;
  }

  ui::web::Site::QueryAnswer ask(ui::web::QueryParameters parameters) {
    return answerSeries(series, parameters);
  }

  std::int64_t clock = 1'700'000'000'000;
  series::SeriesStore series{[this] { return clock; }, 8};
};

TEST_F(SeriesApiTest, ListsEverySeriesWithItsLatestSample) {
  const auto answer = ask({});
  ASSERT_EQ(answer.status, http::status::ok);
  const json::value listing = json::parse(answer.json);
  EXPECT_EQ(listing.at("now"), clock);
  const json::array& all = listing.at("series").as_array();
  ASSERT_EQ(all.size(), series::seriesDefinitions().size());
  for (const json::value& one : all) {
    if (one.at("name") == "gsm.rxlev") {
      EXPECT_EQ(one, (json::value{{"name", "gsm.rxlev"},
                                  {"label", "GSM RxLev"},
                                  {"unit", "dBm"},
                                  {"graph", "level"},
                                  {"count", 3},
                                  {"latest", {clock, -70.0}}}));
    } else {
      EXPECT_EQ(one.at("count"), 0) << one;
      EXPECT_TRUE(one.at("latest").is_null()) << one;
    }
  }
}

TEST_F(SeriesApiTest, AnswersTheSamplesSinceATimeAsColumns) {
  struct Case {
    ui::web::QueryParameters parameters;
    json::array times;
    json::array values;
  };
  const std::int64_t now = clock;
  const Case cases[] = {
      {{{"name", "gsm.rxlev"}}, {now - 2000, now - 1000, now}, {-80.0, -75.0, -70.0}},
      {{{"name", "gsm.rxlev"}, {"since", "0"}},
       {now - 2000, now - 1000, now},
       {-80.0, -75.0, -70.0}},
      {{{"name", "gsm.rxlev"}, {"since", std::to_string(now - 1500)}},
       {now - 1000, now},
       {-75.0, -70.0}},
      {{{"name", "gsm.rxlev"}, {"since", std::to_string(now)}}, {now}, {-70.0}},
      {{{"name", "lte.rsrp"}, {"since", "-5"}}, {}, {}},
  };
  for (const Case& c : cases) {
    const auto answer = ask(c.parameters);
    ASSERT_EQ(answer.status, http::status::ok) << answer.detail;
    const json::value columns = json::parse(answer.json);
    EXPECT_EQ(columns.at("name").as_string(), c.parameters.at("name"));
    EXPECT_EQ(columns.at("times"), c.times) << answer.json;
    EXPECT_EQ(columns.at("values"), c.values) << answer.json;
  }
  EXPECT_EQ(json::parse(ask({{"name", "lte.sinr"}}).json).at("unit"), "dB");
}

TEST_F(SeriesApiTest, RefusesSinceInTheFutureOrMalformedAndNamesNoSeriesItDoesNotHave) {
  struct Case {
    ui::web::QueryParameters parameters;
    http::status status;
    std::string detail;
  };
  const std::string wholeNumber =
      "since wants a whole number of milliseconds since 1970, such as 1700000000000";
  const Case cases[] = {
      {{{"name", "gsm.rxlev"}, {"since", std::to_string(clock + 1)}},
       http::status::bad_request,
       "since is in the future"},
      {{{"name", "gsm.rxlev"}, {"since", "soon"}}, http::status::bad_request, wholeNumber},
      {{{"name", "gsm.rxlev"}, {"since", ""}}, http::status::bad_request, wholeNumber},
      {{{"name", "gsm.rxlev"}, {"since", "1.5"}}, http::status::bad_request, wholeNumber},
      {{{"name", "gsm.rxlev"}, {"since", "+1"}}, http::status::bad_request, wholeNumber},
      {{{"name", "gsm.rxlev"}, {"since", "99999999999999999999"}},
       http::status::bad_request,
       wholeNumber},
      {{{"since", "0"}}, http::status::bad_request, "since goes with the name of a series"},
      {{{"name", "gsm.\"x"}},
       http::status::not_found,
       R"(there is no series called "gsm.\"x"; GET /api/series lists them)"},
  };
  for (const Case& c : cases) {
    const auto answer = ask(c.parameters);
    EXPECT_EQ(answer.status, c.status) << c.detail;
    EXPECT_EQ(answer.detail, c.detail);
    EXPECT_TRUE(answer.json.empty());
  }
}

}  // namespace
}  // namespace dashboard
