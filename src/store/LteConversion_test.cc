#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>

#include "messages/Records.h"
#include "store/StoreTesting.h"

namespace store {
namespace {

using namespace messages;
using platform::Dictionary;
using platform::List;
using platform::Value;
using store::fixtures::kJuly14;
using store::fixtures::kJuly14Text;
using store::fixtures::row;
using V = MetricValidator;

class LteConversionTest : public store::fixtures::StoreTest {};

TEST_F(LteConversionTest, ServingCellInfoHalvesBothBandwidths) {
  KCellularLteScellInfo info;
  info.setTimestamp(kJuly14);
  info.setDlBw(100);
  info.setUlBw(51);
  deliver(V::K_LTE_SCELL_INFO, info);
  const Dictionary& stored = *validator.myLTESCellInfoDict();
  EXPECT_EQ(*stored.find("dl_bw"), Value(50));
  EXPECT_EQ(*stored.find("ul_bw"), Value(25));
  // Halved before the log.
  EXPECT_EQ(log.plainLines()[1], "Current Serving Cell Info is " + stored.description());
}

class LteReselectionTest : public LteConversionTest {
 protected:
  static KCellularLteSelReselCellInfo reselection(std::uint32_t qHyst, std::uint32_t dlBw) {
    KCellularLteSelReselCellInfo info;
    info.setTimestamp(kJuly14);
    info.addMultiBandInfo(3);
    info.addMultiBandInfo(7);
    info.setQHyst(qHyst);
    auto neighbour = std::make_shared<NbrEutra>();
    neighbour->setEarfcn(1300);
    neighbour->setDlBw(dlBw);
    info.addNbrEutra(neighbour);
    return info;
  }
};

TEST_F(LteReselectionTest, KeepsTheNumericTimestampAndShowsTheBandsAsText) {
  deliver(V::K_LTE_SEL_RESEL_INFO, reselection(4, 5));
  const Dictionary& stored = *validator.myLTESelReselDict();
  EXPECT_EQ(*stored.find("timestamp"), Value(kJuly14));
  EXPECT_EQ(*stored.find("multi_band_info"), Value("[3, 7]"));
  EXPECT_THAT(log.plainLines(), ::testing::Contains("[3, 7]"));
}

// Logged as decoded: numeric timestamp and the bands still a list; the band text follows alone.
TEST_F(LteReselectionTest, LogsBeforeTheBandsBecomeText) {
  deliver(V::K_LTE_SEL_RESEL_INFO, reselection(4, 5));
  Dictionary logged = *validator.myLTESelReselDict();
  logged.set("multi_band_info", List{3u, 7u});
  EXPECT_THAT(log.plainLines(),
              ::testing::ElementsAre("Metric ID in Hex = 3CD30E",
                                     "Received LTE Cell Resel Info is " + logged.description(),
                                     "[3, 7]", "Received Valid Metric"));
}

TEST_F(LteReselectionTest, RefreshesItsFixedKeysOneByOne) {
  deliver(V::K_LTE_SEL_RESEL_INFO, reselection(4, 5));
  const Dictionary& copy = validator.myLTE().SelReselCellInfo;
  EXPECT_EQ(copy.size(), 20u);
  EXPECT_EQ(*copy.find("timestamp"), Value(kJuly14Text));
  EXPECT_EQ(*copy.find("multi_band_info"), Value("[3, 7]"));
  EXPECT_EQ(*copy.find("Q_hyst"), Value(4u));
  EXPECT_EQ(*copy.find("QRxLevMin"), Value(""));
  EXPECT_FALSE(copy.contains("nbr_eutra"));

  // A metric without Q_hyst leaves the one before; field 19 never reaches a decoded record.
  KCellularLteSelReselCellInfo next = reselection(0, 5);
  next.setHasQHyst(false);
  next.setThreshServingLowQ(9);
  deliver(V::K_LTE_SEL_RESEL_INFO, next);
  EXPECT_EQ(*validator.myLTE().SelReselCellInfo.find("Q_hyst"), Value(4u));
  EXPECT_EQ(*validator.myLTE().SelReselCellInfo.find("Thresh_serving_lowQ"), Value(""));
}

TEST_F(LteReselectionTest, ConvertsNeighbourBandwidthsAndDropsUnknownCodes) {
  deliver(V::K_LTE_SEL_RESEL_INFO, reselection(4, 5));
  EXPECT_EQ(row(validator.myLTE().EutraNbrs, 0),
            (Dictionary{{"earfcn", 1300u}, {"dl_bw", 20.0f}, {"timestamp", kJuly14Text}}));
  deliver(V::K_LTE_SEL_RESEL_INFO, reselection(4, 9));
  EXPECT_EQ(row(validator.myLTE().EutraNbrs, 0),
            (Dictionary{{"earfcn", 1300u}, {"timestamp", kJuly14Text}}));
}

TEST_F(LteReselectionTest, ShowsAnEmptyBandListAsEmptyBrackets) {
  KCellularLteSelReselCellInfo info;
  deliver(V::K_LTE_SEL_RESEL_INFO, info);
  EXPECT_EQ(*validator.myLTESelReselDict()->find("multi_band_info"), Value("[]"));
  EXPECT_EQ(*validator.myLTE().SelReselCellInfo.find("multi_band_info"), Value("[]"));
  // No neighbours in the metric: the list keeps its placeholder.
  EXPECT_EQ(validator.myLTE().EutraNbrs, placeholderList());
}

TEST_F(LteConversionTest, HalvesSinrAndGivesEachSampleTheTimestampText) {
  KCellularLteRsrpRsrqSinr measurement;
  measurement.setTimestamp(kJuly14);
  auto sample = std::make_shared<RsrpRsrqSinr>();
  sample->setSinr0(25);
  sample->setSinr1(-3);
  measurement.addInstValues(sample);
  deliver(V::K_LTE_RSRP_RSRQ_SINR, measurement);
  EXPECT_EQ(*validator.myLTERsrpRsrqSinrDict()->find("timestamp"), Value(kJuly14));
  EXPECT_EQ(row(validator.myLTE().RsrpRsrqSinr, 0),
            (Dictionary{{"sinr0", 12.5f}, {"sinr1", -1.5f}, {"timestamp", kJuly14Text}}));
}

TEST_F(LteConversionTest, CopiesTxPowerReportsAsTheyAre) {
  KCellularLteTxPower power;
  power.setTimestamp(kJuly14);
  for (const std::int32_t pusch : {-12, 23}) {
    auto info = std::make_shared<TxPowerInfo>();
    info->setPuschTxPower(pusch);
    power.addTxPowerInfo(info);
  }
  deliver(V::K_LTE_TX_POWER, power);
  EXPECT_EQ(validator.myLTE().TxPower,
            (List{Dictionary{{"pusch_tx_power", -12}, {"timestamp", kJuly14Text}},
                  Dictionary{{"pusch_tx_power", 23}, {"timestamp", kJuly14Text}}}));
}

TEST_F(LteConversionTest, EachMetricsRowsReplaceTheLastOnesWhateverTheirCountAndKeys) {
  KCellularLteRsrpRsrqSinr first;
  first.setTimestamp(kJuly14);
  for (const std::int32_t sinr : {25, 4}) {
    auto sample = std::make_shared<RsrpRsrqSinr>();
    sample->setSinr0(sinr);
    sample->setRsrp0(-90);
    first.addInstValues(sample);
  }
  deliver(V::K_LTE_RSRP_RSRQ_SINR, first);

  KCellularLteRsrpRsrqSinr second;
  second.setTimestamp(kJuly14 + 61000);
  auto sample = std::make_shared<RsrpRsrqSinr>();
  sample->setPhyCellId(498);
  second.addInstValues(sample);
  deliver(V::K_LTE_RSRP_RSRQ_SINR, second);
  EXPECT_EQ(validator.myLTE().RsrpRsrqSinr,
            (List{Dictionary{{"phy_cell_id", 498u}, {"timestamp", "2017-07-14 02:41:01 UTC"}}}));
  // The rows are written over, never the display dictionary's elements they come from.
  EXPECT_FALSE(validator.myLTERsrpRsrqSinrDict()
                   ->find("inst_values")
                   ->asList()
                   ->front()
                   .asDictionary()
                   ->contains("timestamp"));
}

class LteCarrierAggregationTest : public LteConversionTest {
 protected:
  static KCellularLteCarrierAggregationStatus status(std::int32_t rsrp, std::uint32_t bandwidth) {
    KCellularLteCarrierAggregationStatus ca;
    ca.setTimestamp(kJuly14);
    auto carrier = std::make_shared<SecondaryComponentCarrier>();
    carrier->setRsrp(rsrp);
    carrier->setRsrq(-1175);
    carrier->setRssi(-6550);
    carrier->setDlBandwidth(bandwidth);
    ca.addSccList(carrier);
    return ca;
  }
};

TEST_F(LteCarrierAggregationTest, TurnsHundredthsOfADbIntoDbAndBandwidthCodesIntoMegahertz) {
  deliver(V::K_LTE_CA_STATUS, status(-10512, 2));
  EXPECT_EQ(row(validator.myLTE().CAStatusList, 0), (Dictionary{{"dl_bandwidth", 5.0f},
                                                                {"rsrp", std::int64_t{-105}},
                                                                {"rsrq", -11.75f},
                                                                {"rssi", std::int64_t{-65}},
                                                                {"timestamp", kJuly14Text}}));
  // The display dictionary keeps the raw levels.
  EXPECT_EQ(*validator.myLTECAStatusDict()
                 ->find("scc_list")
                 ->asList()
                 ->front()
                 .asDictionary()
                 ->find("rsrp"),
            Value(-10512));
}

TEST_F(LteCarrierAggregationTest, TruncatesLevelsTowardZeroAndDropsUnknownBandwidths) {
  deliver(V::K_LTE_CA_STATUS, status(-9850, 9));
  const Dictionary carrier = row(validator.myLTE().CAStatusList, 0);
  EXPECT_EQ(*carrier.find("rsrp"), Value(std::int64_t{-98}));
  EXPECT_FALSE(carrier.contains("dl_bandwidth"));
}

TEST_F(LteCarrierAggregationTest, ReplacesTheListWithEachMetricAndKeepsItWhenTheListIsMissing) {
  deliver(V::K_LTE_CA_STATUS, status(-10000, 1));
  KCellularLteCarrierAggregationStatus two = status(-9000, 3);
  two.addSccList(two.sccListAtIndex(0));
  deliver(V::K_LTE_CA_STATUS, two);
  ASSERT_EQ(validator.myLTE().CAStatusList.size(), 2u);
  EXPECT_EQ(*row(validator.myLTE().CAStatusList, 1).find("rsrp"), Value(std::int64_t{-90}));

  KCellularLteCarrierAggregationStatus none;
  none.setTimestamp(kJuly14 + 1000);
  deliver(V::K_LTE_CA_STATUS, none);
  EXPECT_EQ(validator.myLTE().CAStatusList.size(), 2u);
  EXPECT_FALSE(validator.myLTECAStatusDict()->contains("scc_list"));
}

TEST_F(LteConversionTest, ConvertsSecondaryCellLevelsWithoutABandwidth) {
  KCellularLteSecondaryCellMeasurements measurements;
  measurements.setTimestamp(kJuly14);
  auto cell = std::make_shared<SccRxMeasurement>();
  cell->setIndex(1);
  cell->setRsrp(-10599);
  cell->setRsrq(-1050);
  cell->setRssi(-6501);
  measurements.addSccRxMeasurement(cell);
  deliver(V::K_LTE_SECONDARYCELL_MEAS, measurements);
  EXPECT_EQ(row(validator.myLTE().SecondaryCellMeasList, 0),
            (Dictionary{{"index", 1u},
                        {"rsrp", std::int64_t{-105}},
                        {"rsrq", -10.5f},
                        {"rssi", std::int64_t{-65}},
                        {"timestamp", kJuly14Text}}));
}

TEST_F(LteConversionTest, TurnsEutraNeighbourIndexesIntoDbmAndDb) {
  KCellularLteNbrEutraCellMeas measurement;
  measurement.setTimestamp(kJuly14);
  auto neighbour = std::make_shared<EgwErrcNbrEutraMeas>();
  neighbour->setNbrRsrp(50);
  neighbour->setNbrRsrq(20);
  measurement.addMeasNbrEutra(neighbour);
  deliver(V::K_LTE_INTRARAT_MEAS, measurement);
  EXPECT_EQ(row(validator.myLTE().EutraNbrsMeas, 0),
            (Dictionary{
                {"nbr_rsrp", std::int64_t{-90}}, {"nbr_rsrq", -9.5f}, {"timestamp", kJuly14Text}}));
}

TEST_F(LteConversionTest, InterRatMetricsRefreshOnlyTheListsTheyCarry) {
  KCellularLteNbrInterRatCellMeas both;
  both.setTimestamp(kJuly14);
  auto utra = std::make_shared<EgwErrcNbrUtraMeas>();
  utra->setRscp(40);
  utra->setEcno(30);
  both.addMeasNbrUtra(utra);
  auto geran = std::make_shared<EgwErrcNbrGeranMeas>();
  geran->setRxlev(30);
  both.addMeasNbrGeran(geran);
  deliver(V::K_LTE_INTERRAT_MEAS, both);
  EXPECT_EQ(row(validator.myLTE().UtraNbrsMeas, 0),
            (Dictionary{{"rscp", std::int64_t{-76}}, {"ecno", -9.5f}, {"timestamp", kJuly14Text}}));
  const List geranBefore = validator.myLTE().GeraNbrsMeas;
  EXPECT_EQ(row(geranBefore, 0),
            (Dictionary{{"rxlev", std::int64_t{-80}}, {"timestamp", kJuly14Text}}));

  KCellularLteNbrInterRatCellMeas utraOnly;
  utraOnly.setTimestamp(kJuly14 + 1000);
  utra->setRscp(116);
  utraOnly.addMeasNbrUtra(utra);
  deliver(V::K_LTE_INTERRAT_MEAS, utraOnly);
  EXPECT_EQ(*row(validator.myLTE().UtraNbrsMeas, 0).find("rscp"), Value(std::int64_t{0}));
  EXPECT_EQ(validator.myLTE().GeraNbrsMeas, geranBefore);
}

}  // namespace
}  // namespace store
