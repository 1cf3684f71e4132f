#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "messages/Records.h"
#include "series/SampleRing.h"
#include "series/SeriesStore.h"
#include "store/StoreTesting.h"

namespace series {
namespace {

using namespace messages;
using V = store::MetricValidator;

class SeriesStoreTest : public store::fixtures::StoreTest {
 protected:
  SeriesStoreTest() {
    validator.addStoreObserver([this](store::DisplayDictionary replaced, const V& intake) {
      series.storeDidUpdate(replaced, intake);
    });
  }

  // The latest value of every series that has one.
  std::map<std::string, double> latestValues() const {
    std::map<std::string, double> values;
    for (const SeriesDefinition& definition : series.definitions()) {
      if (const auto sample = series.latest(definition.name))
        values[std::string(definition.name)] = sample->value;
    }
    return values;
  }

  std::int64_t clock = 1'700'000'000'000;
  SeriesStore series{[this] { return clock; }, 16};
};

TEST_F(SeriesStoreTest, EveryFeedNamesASeriesOfOneUnitAndEverySeriesIsFed) {
  std::set<std::string_view> names, fed;
  for (const SeriesDefinition& definition : seriesDefinitions()) {
    EXPECT_TRUE(names.insert(definition.name).second) << definition.name;
    EXPECT_THAT(definition.unit, ::testing::AnyOf("dBm", "dB")) << definition.name;
  }
  for (const Feed& feed : feeds()) {
    EXPECT_TRUE(names.contains(feed.series)) << feed.series;
    EXPECT_EQ(feed.rows == nullptr, feed.carriedBy.empty()) << feed.series;
    fed.insert(feed.series);
  }
  EXPECT_EQ(fed, names);
}

TEST_F(SeriesStoreTest, ServingLevelsOfEachTechnologyInTheUnitsTheScreensShow) {
  KCellularLteRsrpRsrqSinr lte;
  lte.setTimestamp(store::fixtures::kJuly14);
  for (const int rsrp : {-95, -90}) {
    auto sample = std::make_shared<RsrpRsrqSinr>();
    sample->setRsrp0(rsrp);
    sample->setRsrq0(-11);
    sample->setSinr0(25);  // half dB
    lte.addInstValues(sample);
  }
  deliver(V::K_LTE_RSRP_RSRQ_SINR, lte);

  KCellularLteTxPower lteTx;
  for (const int power : {3, 12, -4}) {
    auto sample = std::make_shared<TxPowerInfo>();
    sample->setPuschTxPower(power);
    lteTx.addTxPowerInfo(sample);
  }
  deliver(V::K_LTE_TX_POWER, lteTx);

  KCellularWcdmaScellMeasurement umts;
  auto rx = std::make_shared<RxInfo>();
  rx->setRssi(-70);
  rx->setRsrpRange(30);  // RSCP index
  rx->setRsrqRange(40);  // Ec/No index
  umts.addRxInfo(rx);
  deliver(V::K_UMTS_SCELL_MEAS, umts);

  KCellularGsmCsRfMeasurement dedicated;
  dedicated.setCsRxlevSub(30);  // RxLev index
  for (const int power : {5, 9, 7})
    dedicated.addCsTxPwr(power);
  deliver(V::K_GSM_CS_RF_MEAS, dedicated);

  EXPECT_EQ(latestValues(), (std::map<std::string, double>{{"lte.rsrp", -95},
                                                           {"lte.rsrq", -11},
                                                           {"lte.sinr", 12.5},
                                                           {"lte.tx_power", 12},
                                                           {"umts.rscp", -86},
                                                           {"umts.ecno", -4.5},
                                                           {"umts.rssi", -70},
                                                           {"gsm.rxlev", -80},
                                                           {"gsm.tx_power", 9}}));

  // Idle measurements feed the same GSM level.
  clock += 940;
  KCellularGsmIdleScellMeasurement idle;
  idle.setIdleRxlevDBm(-77);
  deliver(V::K_GSM_IDLE_SCELL_MEAS, idle);
  const SampleRange levels = *series.since("gsm.rxlev", 0);
  EXPECT_THAT(std::vector<Sample>(levels.begin(), levels.end()),
              ::testing::ElementsAre(Sample{clock - 940, -80}, Sample{clock, -77}));
}

TEST_F(SeriesStoreTest, EachSecondaryCarrierByItsIndex) {
  KCellularLteSecondaryCellMeasurements carriers;
  for (const auto& [index, rsrp, snr] : {std::tuple{2u, -10512, 1250}, {1u, -9850, -300}}) {
    auto carrier = std::make_shared<SccRxMeasurement>();
    carrier->setIndex(index);
    carrier->setRsrp(rsrp);
    carrier->setSnr(snr);
    carriers.addSccRxMeasurement(carrier);
  }
  deliver(V::K_LTE_SECONDARYCELL_MEAS, carriers);
  EXPECT_EQ(latestValues(), (std::map<std::string, double>{{"lte.scc1.rsrp", -98},
                                                           {"lte.scc1.sinr", -3},
                                                           {"lte.scc2.rsrp", -105},
                                                           {"lte.scc2.sinr", 12.5}}));
}

TEST_F(SeriesStoreTest, TheStrongestNeighbourOnlyFromMetricsThatCarryTheList) {
  KCellularLteNbrInterRatCellMeas interRat;
  for (const auto& [rscp, rxlev] : {std::pair{20, 30u}, {40, 25u}}) {
    auto utra = std::make_shared<EgwErrcNbrUtraMeas>();
    utra->setRscp(rscp);
    interRat.addMeasNbrUtra(utra);
    auto geran = std::make_shared<EgwErrcNbrGeranMeas>();
    geran->setRxlev(rxlev);
    interRat.addMeasNbrGeran(geran);
  }
  deliver(V::K_LTE_INTERRAT_MEAS, interRat);
  EXPECT_EQ(latestValues(), (std::map<std::string, double>{{"neighbour.umts.rscp", -76},
                                                           {"neighbour.gsm.rxlev", -80}}));

  // Without GERAN neighbours the store keeps the old rows; they are no new sample.
  KCellularLteNbrInterRatCellMeas utraOnly;
  auto utra = std::make_shared<EgwErrcNbrUtraMeas>();
  utra->setRscp(10);
  utraOnly.addMeasNbrUtra(utra);
  deliver(V::K_LTE_INTERRAT_MEAS, utraOnly);
  EXPECT_EQ(series.since("neighbour.umts.rscp", 0)->size(), 2u);
  EXPECT_EQ(series.since("neighbour.gsm.rxlev", 0)->size(), 1u);
  EXPECT_EQ(series.latest("neighbour.umts.rscp")->value, -106);
}

TEST_F(SeriesStoreTest, NothingFromMetricsWithoutTheValueOrThatDoNotDecode) {
  deliver(V::K_LTE_TX_POWER, KCellularLteTxPower());  // no samples: placeholder rows stay
  deliver(V::K_LTE_RRC_STATE, KCellularLteRrcState());
  validator.metricsDidUpdate({{"kKeyMetricID", V::K_LTE_RSRP_RSRQ_SINR},
                              {"kKeyPayload", platform::Bytes{0xFF, 0xFF, 0xFF}}});
  EXPECT_THAT(latestValues(), ::testing::IsEmpty());
}

TEST_F(SeriesStoreTest, AnswersOnlyForItsSeriesAndTellsListenersOfEachSample) {
  std::vector<std::pair<std::string, Sample>> heard;
  series.addAppendListener(
      [&heard](std::string_view name, Sample sample) { heard.emplace_back(name, sample); });
  KCellularGsmIdleScellMeasurement idle;
  idle.setIdleRxlevDBm(-77);
  deliver(V::K_GSM_IDLE_SCELL_MEAS, idle);
  EXPECT_THAT(heard,
              ::testing::ElementsAre(std::pair{std::string("gsm.rxlev"), Sample{clock, -77}}));
  EXPECT_FALSE(series.latest("gsm.nothing"));
  EXPECT_FALSE(series.since("gsm.nothing", 0));
  EXPECT_EQ(series.definition("gsm.rxlev")->unit, "dBm");
  EXPECT_EQ(series.definition("nothing"), nullptr);
  EXPECT_EQ(series.capacity(), 16u);
}

using ::testing::ElementsAreArray;

std::vector<Sample> samplesOf(const SampleRange& range) {
  return {range.begin(), range.end()};
}

// A ring holding the samples (t, t / 10) for t = 10, 20, ... count * 10.
SampleRing filled(std::size_t capacity, int count) {
  SampleRing ring(capacity);
  for (int i = 1; i <= count; ++i)
    ring.append(i * 10, static_cast<float>(i));
  return ring;
}

TEST(SampleRingTest, HoldsThePowerOfTwoAtOrAboveItsCapacity) {
  for (const auto& [asked, held] : std::vector<std::pair<std::size_t, std::size_t>>{
           {0, 1}, {1, 1}, {3, 4}, {4, 4}, {5, 8}, {8192, 8192}}) {
    EXPECT_EQ(SampleRing(asked).capacity(), held) << asked;
  }
}

TEST(SampleRingTest, KeepsTheLatestSamplesOldestFirst) {
  struct Case {
    int appended;
    std::vector<Sample> held;
  };
  const Case cases[] = {
      {0, {}},
      {1, {{10, 1}}},
      {4, {{10, 1}, {20, 2}, {30, 3}, {40, 4}}},
      {5, {{20, 2}, {30, 3}, {40, 4}, {50, 5}}},
      {11, {{80, 8}, {90, 9}, {100, 10}, {110, 11}}},
  };
  for (const Case& c : cases) {
    const SampleRing ring = filled(4, c.appended);
    EXPECT_THAT(samplesOf(ring.all()), ElementsAreArray(c.held)) << c.appended;
    EXPECT_EQ(ring.size(), c.held.size());
    EXPECT_EQ(ring.latest(), c.held.empty() ? std::nullopt : std::optional(c.held.back()));
  }
}

TEST(SampleRingTest, FindsTheSamplesSinceATimeAcrossTheWrap) {
  const SampleRing ring = filled(8, 13);  // holds t = 60 ... 130
  struct Case {
    std::int64_t since;
    std::size_t count;
    std::int64_t first;
  };
  const Case cases[] = {
      {-1000, 8, 60}, {60, 8, 60},   {61, 7, 70}, {100, 4, 100},
      {125, 1, 130},  {130, 1, 130}, {131, 0, 0},
  };
  for (const Case& c : cases) {
    const SampleRange range = ring.since(c.since);
    ASSERT_EQ(range.size(), c.count) << c.since;
    if (c.count > 0) {
      EXPECT_EQ(range[0].timeMs, c.first) << c.since;
      EXPECT_EQ(range[c.count - 1].timeMs, 130) << c.since;
    }
  }
  EXPECT_TRUE(SampleRing(4).since(0).empty());
}

TEST(SampleRingTest, ASampleFromThePastTakesTheLatestTime) {
  SampleRing ring(4);
  ring.append(100, 1.0F);
  ring.append(90, 2.0F);  // the wall clock stepped back
  ring.append(100, 3.0F);
  EXPECT_THAT(samplesOf(ring.all()),
              ElementsAreArray(std::vector<Sample>{{100, 1}, {100, 2}, {100, 3}}));
  EXPECT_EQ(ring.since(100).size(), 3u);
}

}  // namespace
}  // namespace series
