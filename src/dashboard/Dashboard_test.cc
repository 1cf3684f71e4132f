#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <map>
#include <memory>

#include "dashboard/SeriesApi.h"
#include "dashboard/ServingCell.h"
#include "messages/Records.h"
#include "platform/Json.h"
#include "radio/Iccid.h"
#include "radio/Imsi.h"
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

  ui::web::Site::QueryAnswer ask(const ui::web::QueryParameters& parameters) {
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

using namespace messages;
using platform::Dictionary;
using platform::Value;
using V = store::MetricValidator;

class ServingCellTest : public store::fixtures::StoreTest {
 protected:
  ServingCellTest() {
    validator.addStoreObserver([this](store::DisplayDictionary replaced, const V& intake) {
      series.storeDidUpdate(replaced, intake);
    });
  }

  // The card's rows as label to value.
  std::map<std::string, std::string> rows() const {
    std::map<std::string, std::string> shown;
    const Dictionary card = dashboardCard(validator, series);
    for (const Value& row : *card.find("rows")->asList()) {
      const Dictionary& entry = *row.asDictionary();
      shown[*entry.find("label")->asString()] = *entry.find("value")->asString();
    }
    return shown;
  }

  void lteCell(std::uint32_t earfcn) {
    KCellularLteRrcState state;
    state.setState(KCellularLteRrcState::KLTE_RRC_STATE_CONNECTED);
    deliver(V::K_LTE_RRC_STATE, state);
    KCellularLteScellInfo cell;
    cell.setPhyCellId(301);
    cell.setDlFreq(earfcn);
    cell.setCellId(0x1234567);
    cell.setTrackingAreaCode(4660);
    cell.setSelPlmnMcc(1);
    cell.setSelPlmnMnc(1);
    cell.setNumMncDigits(2);
    deliver(V::K_LTE_SCELL_INFO, cell);
    KCellularLteRsrpRsrqSinr levels;
    auto sample = std::make_shared<RsrpRsrqSinr>();
    sample->setRsrp0(-95);
    sample->setRsrq0(-8);
    sample->setSinr0(50);
    levels.addInstValues(sample);
    deliver(V::K_LTE_RSRP_RSRQ_SINR, levels);
  }

  void gsmCell(std::uint32_t arfcn, std::optional<SysBand> band) {
    KCellularGsmScellInfo cell;
    cell.setMcc(310);
    cell.setMnc(260);
    cell.setNumMncDigits(3);
    cell.setLac(1001);
    cell.setCellId(5021);
    cell.setArfcn(arfcn);
    cell.setBsic(23);
    if (band) cell.setGsmBand(*band);
    deliver(V::K_GSM_SCELL_INFO, cell);
    KCellularGsmIdleScellMeasurement level;
    level.setIdleRxlevDBm(-104);
    deliver(V::K_GSM_IDLE_SCELL_MEAS, level);
  }

  std::int64_t clock = 1'700'000'000'000;
  series::SeriesStore series{[this] { return clock; }, 16};
};

TEST_F(ServingCellTest, ShowsTheLteCellWithItsBandFrequenciesAndColouredLevels) {
  lteCell(1300);
  // The card as the page receives it, rows in order.
  const std::string card = platform::toJson(dashboardCard(validator, series));
  EXPECT_EQ(
      card.substr(0, card.find(R"(,"carriers")")),
      R"({"technology":"LTE","rows":[{"label":"Technology","value":"LTE"},)"
      R"({"label":"RRC state","value":"CONNECTED"},{"label":"Operator","value":"001-01"},)"
      R"({"label":"Cell ID","value":"19088743"},{"label":"eNB","value":"74565"},)"
      R"({"label":"Sector","value":"103"},{"label":"PCI","value":"301"},)"
      R"({"label":"EARFCN","value":"1300"},{"label":"Band","value":"3"},)"
      R"({"label":"Downlink","value":"1815.0 MHz"},{"label":"Uplink","value":"1720.0 MHz"},)"
      R"({"label":"TAC","value":"4660"}],"levels":[)"  // no transmit power yet
      R"({"name":"lte.rsrp","label":"RSRP","value":-95.0,"unit":"dBm","quality":"fair"},)"
      R"({"name":"lte.rsrq","label":"RSRQ","value":-8.0,"unit":"dB","quality":"excellent"},)"
      R"({"name":"lte.sinr","label":"SINR","value":25.0,"unit":"dB","quality":"excellent"}])");
}

TEST_F(ServingCellTest, ShowsANumberNoBandHoldsAsItIsWithoutAGuess) {
  struct Case {
    std::uint32_t arfcn;
    std::optional<SysBand> band;
    std::optional<std::string> bandName, downlink;
  };
  const Case cases[] = {
      {600, SYS_BAND_GSM_DCS_1800, "DCS 1800", "1822.8 MHz"},
      {600, std::nullopt, std::nullopt, std::nullopt},  // DCS or PCS: no guess
      {62, SYS_BAND_GSM_PGSM_900, "P-GSM 900", "947.4 MHz"},
      {2000, SYS_BAND_GSM_PGSM_900, std::nullopt, std::nullopt},
  };
  for (const Case& c : cases) {
    gsmCell(c.arfcn, c.band);
    const auto shown = rows();
    EXPECT_EQ(shown.at("Technology"), "GSM");
    EXPECT_EQ(shown.at("Operator"), "310-260");
    EXPECT_EQ(shown.at("ARFCN"), std::to_string(c.arfcn));
    EXPECT_EQ(shown.contains("Band") ? std::optional(shown.at("Band")) : std::nullopt, c.bandName)
        << c.arfcn;
    EXPECT_EQ(shown.contains("Downlink") ? std::optional(shown.at("Downlink")) : std::nullopt,
              c.downlink)
        << c.arfcn;
    clock += 1000;
  }
}

TEST_F(ServingCellTest, FollowsTheTechnologyWhoseLevelCameLastUntilItStops) {
  lteCell(1300);
  clock += 500;
  gsmCell(62, SYS_BAND_GSM_PGSM_900);
  EXPECT_EQ(servingLevel(series)->technology, "GSM");
  EXPECT_EQ(servingLevel(series)->sample.value, -104);
  clock += 500;
  lteCell(1300);
  EXPECT_EQ(servingLevel(series)->technology, "LTE");

  clock += kServingLevelStaleMs + 1;
  EXPECT_FALSE(servingLevel(series));
  const Dictionary card = dashboardCard(validator, series);
  EXPECT_TRUE(card.find("technology")->isNull());
  EXPECT_TRUE(card.find("rows")->asList()->empty());
}

TEST_F(ServingCellTest, ShowsTheCarriersAndTheSubscriberFromTheSimFiles) {
  KCellularLteCarrierAggregationStatus status;
  auto carrier = std::make_shared<SecondaryComponentCarrier>();
  carrier->setIndex(1);
  carrier->setState(SecondaryComponentCarrier::SCC_STATE_ACTIVATED);
  carrier->setPci(17);
  carrier->setDlEarfcn(3050);
  carrier->setDlBandwidth(2);
  carrier->setRsrp(-10512);
  carrier->setRsrq(-1175);
  status.addSccList(carrier);
  deliver(V::K_LTE_CA_STATUS, status);

  KCellularSimCardFiles sim;
  const auto file = [&sim](std::uint32_t id, platform::Bytes content) {
    auto ef = std::make_shared<ElementaryFile>();
    ef->setEfId(id);
    ef->setContent(std::move(content));
    sim.addEfList(ef);
  };
  file(0x2FE2, *radio::encodeEfIccid("8949001234567890123"));
  file(0x6F07, *radio::encodeEfImsi("001010123456789"));
  file(0x6F46, {0x01, 'T', 'e', 's', 't', ' ', 'N', 'e', 't', 0xFF, 0xFF});
  file(0x6FAD, {0x00, 0x00, 0x00, 0x02});
  deliver(V::K_SIM_FILE_INFO, sim);

  const Dictionary card = dashboardCard(validator, series);
  EXPECT_EQ(platform::toJson(*card.find("carriers")),
            R"([{"index":1,"pci":17,"rsrp":-105,"rsrq":-11.75,"state":"ACTIVATED","earfcn":3050,)"
            R"("band":"7","downlink":"2650.0 MHz","bandwidth":"5.0 MHz"}])");
  EXPECT_EQ(platform::toJson(*card.find("subscriber")),
            R"({"imsi":"001010123456789","mcc":"001","mnc":"01","msin":"0123456789",)"
            R"("iccid":"8949001234567890123"})");
  lteCell(1300);
  EXPECT_EQ(rows().at("Network"), "Test Net");
}

TEST_F(ServingCellTest, ShowsNothingBeforeTheFirstMetrics) {
  EXPECT_EQ(platform::toJson(dashboardCard(validator, series)),
            R"({"technology":null,"rows":[],"levels":[],"carriers":[],"subscriber":null})");
}

}  // namespace
}  // namespace dashboard
