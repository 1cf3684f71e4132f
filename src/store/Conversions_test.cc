#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <memory>

#include "messages/Records.h"
#include "store/EntryRules.h"
#include "store/StoreTesting.h"
#include "tarn/sim/Units.h"

namespace store {
namespace {

using platform::Dictionary;
using platform::List;
using platform::Value;
using namespace messages;
using store::fixtures::kJuly14;
using store::fixtures::kJuly14Text;
using store::fixtures::row;
using V = MetricValidator;
using platform::Bytes;

// A formatter that shows which number it was given.
std::optional<std::string> tagged(double milliseconds) {
  if (milliseconds < 0) return std::nullopt;
  return "at " + std::to_string(static_cast<long long>(milliseconds));
}

Dictionary converted(Dictionary dictionary, EntryConversion conversion) {
  convertEntry(dictionary, conversion, tagged);
  return dictionary;
}

// The value the intake shows for a level the simulator encoded.
double shown(std::int64_t encoded, EntryRule rule) {
  const Dictionary level = converted({{"level", encoded}}, {"level", rule});
  return level.find("level")->asDouble().value_or(0.0);
}

TEST(EntryRules, ShowTheLevelsTheSimulatorEncodesWithinHalfAStep) {
  namespace units = tarn::sim::units;
  struct Range {
    EntryRule rule;
    std::uint32_t (*encode)(double);
    double low, high, tolerance;
  };
  const Range ranges[] = {
      {EntryRule::RsrpIndex, units::rsrpIndex, -139.0, -44.0, 0.5},
      {EntryRule::RsrqIndex, units::rsrqIndex, -19.5, -3.0, 0.25},
      {EntryRule::RscpIndex, units::rscpIndex, -116.0, -25.0, 0.5},
      {EntryRule::EcNoIndex, units::ecnoIndex, -24.5, 0.0, 0.25},
      {EntryRule::RxLevIndex, units::rxlevIndex, -110.0, -47.0, 0.5},
  };
  for (const Range& range : ranges) {
    for (double level = range.low; level <= range.high; level += 0.1)
      EXPECT_NEAR(shown(range.encode(level), range.rule), level, range.tolerance) << level;
  }
  EXPECT_NEAR(shown(units::centiDb(-98.504), EntryRule::CentiDbFloat), -98.5, 0.005);
  EXPECT_NEAR(shown(units::halfDb(12.4), EntryRule::SinrHalfDb), 12.5, 0.25);
}

TEST(EntryRules, LeaveEntriesOfAnotherTypeAsTheyAre) {
  for (const EntryRule rule : {EntryRule::CentiDbInteger, EntryRule::CentiDbFloat,
                               EntryRule::RsrpIndex, EntryRule::RsrqIndex, EntryRule::BandwidthCode,
                               EntryRule::HalvedBandwidth, EntryRule::TimestampText}) {
    const Dictionary text{{"level", "-98 dBm"}, {"other", 1}};
    EXPECT_EQ(converted(text, {"level", rule}), text);
    EXPECT_EQ(converted(text, {"missing", rule}), text);
  }
}

TEST(EntryRules, ConvertWhatTheyCanAndDropOrLeaveTheRest) {
  const EntryConversion code{"dl_bw", EntryRule::BandwidthCode};
  const EntryConversion halved{"dl_bw", EntryRule::HalvedBandwidth};
  const EntryConversion rscp{"rscp", EntryRule::RscpIndex};
  const EntryConversion time{"timestamp", EntryRule::TimestampText};
  const struct {
    const char* name;
    Dictionary before;
    EntryConversion conversion;
    std::optional<Dictionary> after;  // none: left as it was
  } cases[] = {
      {"code 0 in megahertz", {{"dl_bw", 0}}, code, Dictionary{{"dl_bw", 1.4f}}},
      {"code -1 dropped", {{"dl_bw", -1}, {"earfcn", 300}}, code, Dictionary{{"earfcn", 300}}},
      {"code 6 dropped", {{"dl_bw", 6}, {"earfcn", 300}}, code, Dictionary{{"earfcn", 300}}},
      {"code 9 dropped", {{"dl_bw", std::int64_t{9}}}, code, Dictionary{}},
      {"largest uint32 is no code", {{"dl_bw", std::uint32_t{4294967295u}}}, code, {}},
      {"2^40 is no code", {{"dl_bw", std::int64_t{1} << 40}}, code, {}},
      {"text is no code", {{"dl_bw", "3"}}, code, {}},
      {"a fraction is no code", {{"dl_bw", 2.5}}, code, {}},
      {"a fraction is no index", {{"dl_bw", 2.5}}, {"dl_bw", EntryRule::RxLevIndex}, {}},
      {"index would overflow below",
       {{"rscp", std::numeric_limits<std::int64_t>::min()}},
       rscp,
       {}},
      {"index would overflow above",
       {{"rscp", std::numeric_limits<std::uint64_t>::max()}},
       rscp,
       {}},
      {"32-bit bandwidth halved", {{"dl_bw", -7}}, halved, Dictionary{{"dl_bw", -3}}},
      {"wider bandwidth kept", {{"dl_bw", std::uint32_t{4000000000u}}}, halved, {}},
      {"timestamp shown",
       {{"timestamp", std::uint64_t{1500}}},
       time,
       Dictionary{{"timestamp", "at 1500"}}},
      {"timestamp the formatter cannot show", {{"timestamp", -5}}, time, {}},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.name);
    EXPECT_EQ(converted(c.before, c.conversion), c.after.value_or(c.before));
  }
}

TEST(EntryRules, RecogniseTheShapesThatBecomeText) {
  EXPECT_TRUE(hasShape(List{1, 3u, std::int64_t{7}}, ValueShape::IntegerList));
  EXPECT_TRUE(hasShape(List{}, ValueShape::IntegerList));
  EXPECT_FALSE(hasShape(List{1, 2.0}, ValueShape::IntegerList));
  EXPECT_FALSE(hasShape(List{true}, ValueShape::IntegerList));
  EXPECT_TRUE(hasShape(Dictionary{}, ValueShape::Dictionary));
  EXPECT_FALSE(hasShape(List{}, ValueShape::Dictionary));
  EXPECT_TRUE(hasShape(List{Dictionary{}, Dictionary{{"a", 1}}}, ValueShape::DictionaryList));
  EXPECT_FALSE(hasShape(List{Dictionary{}, 1}, ValueShape::DictionaryList));
  EXPECT_FALSE(hasShape(Dictionary{}, ValueShape::DictionaryList));
}

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

// Logged as decoded: numeric timestamp and the bands still a list; the band text follows alone.
TEST_F(LteReselectionTest, KeepsTheNumericTimestampAndLogsBeforeTheBandsBecomeText) {
  deliver(V::K_LTE_SEL_RESEL_INFO, reselection(4, 5));
  Dictionary logged = *validator.myLTESelReselDict();
  EXPECT_EQ(*logged.find("timestamp"), Value(kJuly14));
  EXPECT_EQ(*logged.find("multi_band_info"), Value("[3, 7]"));
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
  EXPECT_EQ(row(validator.myLTE().EutraNbrs, 0),
            (Dictionary{{"earfcn", 1300u}, {"dl_bw", 20.0f}, {"timestamp", kJuly14Text}}));

  // A metric without Q_hyst leaves the one before; field 19 never reaches a decoded record; an
  // unknown bandwidth code is dropped.
  KCellularLteSelReselCellInfo next = reselection(0, 9);
  next.setHasQHyst(false);
  next.setThreshServingLowQ(9);
  deliver(V::K_LTE_SEL_RESEL_INFO, next);
  EXPECT_EQ(*validator.myLTE().SelReselCellInfo.find("Q_hyst"), Value(4u));
  EXPECT_EQ(*validator.myLTE().SelReselCellInfo.find("Thresh_serving_lowQ"), Value(""));
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

  // Levels truncate toward zero; unknown bandwidth codes are dropped.
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

class UmtsConversionTest : public store::fixtures::StoreTest {};

TEST_F(UmtsConversionTest, TurnsNeighbourIndexesOfAllThreeTechnologiesIntoDbmAndDb) {
  KCellularWcdmaNbrCellMeas measurement;
  measurement.setTimestamp(kJuly14);
  auto utra = std::make_shared<UtraCellMeasResult>();
  utra->setRscp(30);
  utra->setEcno(40);
  measurement.addMeasUtraResult(utra);
  auto lte = std::make_shared<LteCellMeasResult>();
  lte->setRsrp(45);
  lte->setRsrq(15);
  measurement.addMeasLteResult(lte);
  auto gsm = std::make_shared<GsmCellMeasResult>();
  gsm->setRxlev(63);
  measurement.addMeasGsmResult(gsm);
  deliver(V::K_UMTS_NCELL_MEAS, measurement);

  const UMTS& umts = validator.myUMTS();
  EXPECT_EQ(row(umts.utraNbrMeas, 0),
            (Dictionary{{"ecno", -4.5f}, {"rscp", std::int64_t{-86}}, {"timestamp", kJuly14Text}}));
  EXPECT_EQ(
      row(umts.eUtraNbrMeas, 0),
      (Dictionary{{"rsrp", std::int64_t{-95}}, {"rsrq", -12.0f}, {"timestamp", kJuly14Text}}));
  EXPECT_EQ(row(umts.geraNbrMeas, 0),
            (Dictionary{{"rxlev", std::int64_t{-47}}, {"timestamp", kJuly14Text}}));
}

TEST_F(UmtsConversionTest, GivesEachReceiveMeasurementTheModeAndTimeOfItsMetric) {
  KCellularWcdmaScellMeasurement measurement;
  measurement.setTimestamp(kJuly14);
  measurement.setConnectedMode(true);
  for (const std::int32_t rssi : {-70, -72}) {
    auto info = std::make_shared<RxInfo>();
    info->setRssi(rssi);
    measurement.addRxInfo(info);
  }
  deliver(V::K_UMTS_SCELL_MEAS, measurement);
  EXPECT_EQ(
      validator.myUMTS().rXInfo,
      (List{Dictionary{{"rssi", -70}, {"connected_mode", true}, {"timestamp", kJuly14Text}},
            Dictionary{{"rssi", -72}, {"connected_mode", true}, {"timestamp", kJuly14Text}}}));

  // Without a mode or a time in the metric, the rows have none either.
  KCellularWcdmaScellMeasurement bare;
  bare.addRxInfo(std::make_shared<RxInfo>());
  deliver(V::K_UMTS_SCELL_MEAS, bare);
  EXPECT_EQ(validator.myUMTS().rXInfo, (List{Dictionary{}}));
}

TEST_F(UmtsConversionTest, CopiesTxPowerReportsWithTheTimestampText) {
  KCellularWcdmaTxPower power;
  power.setTimestamp(kJuly14);
  power.addTxPowerInfo(std::make_shared<TxPowerInfo>());
  deliver(V::K_UMTS_TX_POWER, power);
  EXPECT_EQ(validator.myUMTS().TxPower, (List{Dictionary{{"timestamp", kJuly14Text}}}));
}

class UmtsReselectionTest : public UmtsConversionTest {
 protected:
  static KCellularWcdmaSelReselCellInfo reselection() {
    KCellularWcdmaSelReselCellInfo info;
    info.setTimestamp(kJuly14);
    info.setSRxlev(-58);
    auto eutra = std::make_shared<EutraFreqInfo>();
    eutra->setEarfcn(1300);
    info.addEutraPrioInfo(eutra);
    auto utra = std::make_shared<UtraFreqInfo>();
    utra->setUarfcn(10700);
    info.addUtraPrioInfo(utra);
    return info;
  }
};

TEST_F(UmtsReselectionTest, RefreshesItsFixedKeysWithTextTimestampAndBands) {
  deliver(V::K_UMTS_SEL_RESEL_INFO, reselection());
  const Dictionary& copy = validator.myUMTS().SelReselCellInfo;
  EXPECT_EQ(copy.size(), 14u);
  EXPECT_EQ(*copy.find("timestamp"), Value(kJuly14Text));
  EXPECT_EQ(*copy.find("multi_band_info"), Value("[]"));
  EXPECT_EQ(*copy.find("s_rxlev"), Value(-58));
  EXPECT_EQ(*copy.find("s_qual"), Value(""));
  for (const char* list : {"eutra_prio_info", "utra_prio_info", "gsm_prio_info"}) {
    EXPECT_FALSE(copy.contains(list)) << list;
  }
  EXPECT_EQ(*validator.myUMTSSelReselDict()->find("timestamp"), Value(kJuly14Text));
  // Only the priority lists the metric carries are filled.
  const UMTS& umts = validator.myUMTS();
  EXPECT_EQ(umts.eUtraNbrs, (List{Dictionary{{"earfcn", 1300u}, {"timestamp", kJuly14Text}}}));
  EXPECT_EQ(umts.utraNbrs, (List{Dictionary{{"uarfcn", 10700u}, {"timestamp", kJuly14Text}}}));
  EXPECT_EQ(umts.geraNbrs, placeholderList());
}

// Logged after the timestamp became text but before the bands do; the band text follows alone.
TEST_F(UmtsReselectionTest, LogsBetweenTheTimestampAndTheBandText) {
  KCellularWcdmaSelReselCellInfo info = reselection();
  info.addMultiBandInfo(1);
  info.addMultiBandInfo(8);
  deliver(V::K_UMTS_SEL_RESEL_INFO, info);
  Dictionary logged = *validator.myUMTSSelReselDict();
  EXPECT_EQ(*logged.find("timestamp"), Value(kJuly14Text));
  logged.set("multi_band_info", List{1u, 8u});
  EXPECT_THAT(log.plainLines(),
              ::testing::ElementsAre("Metric ID in Hex = 3CD104",
                                     "Received UMTS Cell Resel Info is " + logged.description(),
                                     "[1, 8]", "Received Valid Metric"));
}

class GsmNasConversionTest : public store::fixtures::StoreTest {};

TEST_F(GsmNasConversionTest, ConvertsGsmNeighbourLevelsAndLeavesAbsentListsAlone) {
  KCellularGsmGrrEventMeasCr measurement;
  measurement.setTimestamp(kJuly14);
  auto gsm = std::make_shared<GsmNcellMeas>();
  gsm->setRxlev(20);
  measurement.addGsmNcellMeas(gsm);
  auto umts = std::make_shared<UmtsNcellMeas>();
  umts->setCpichRscp(10);
  umts->setCpichEcn0(6);
  measurement.addUmtsNcellMeas(umts);
  deliver(V::K_GSM_NCELL_MEAS, measurement);

  const GSM& stored = validator.myGSM();
  EXPECT_EQ(row(stored.geraNbrMeas, 0),
            (Dictionary{{"rxlev", std::int64_t{-90}}, {"timestamp", kJuly14Text}}));
  EXPECT_EQ(row(stored.utraNbrMeas, 0), (Dictionary{{"cpich_rscp", std::int64_t{-106}},
                                                    {"cpich_ecn0", -21.5f},
                                                    {"timestamp", kJuly14Text}}));
  EXPECT_EQ(stored.eUtraNbrMeas, placeholderList());

  KCellularGsmGrrEventMeasCr lteOnly;
  auto lte = std::make_shared<LteNcellMeas>();
  lte->setRsrp(97);
  lte->setRsrq(34);
  lteOnly.addLteNcellMeas(lte);
  deliver(V::K_GSM_NCELL_MEAS, lteOnly);
  EXPECT_EQ(validator.myGSM().eUtraNbrMeas,
            (List{Dictionary{{"rsrp", std::int64_t{-43}}, {"rsrq", -2.5f}}}));
  EXPECT_EQ(row(validator.myGSM().geraNbrMeas, 0).find("rxlev")->asInteger(), -90);
}

TEST_F(GsmNasConversionTest, ShowsTheEmmIdentityAndTrackingAreasAsOneTextEach) {
  KCellularEmmContext context;
  context.setTimestamp(kJuly14);
  auto guti = std::make_shared<Guti>();
  guti->setMmegi(32769);
  guti->setMmec(12);
  context.setGuti(guti);
  for (const std::uint32_t tac : {1u, 2u}) {
    auto area = std::make_shared<KCellularTrackingAreaId>();
    area->setTac(tac);
    context.addTaiList(area);
  }
  deliver(V::K_LTE_EMM_CTXT, context);
  const Dictionary& stored = *validator.myLTEEMMContextDict();
  EXPECT_EQ(*stored.find("guti"), Value(R"(["mmegi": 32769, "mmec": 12])"));
  EXPECT_EQ(*stored.find("tai_list"), Value(R"([["tac": 1], ["tac": 2]])"));
  EXPECT_EQ(*stored.find("timestamp"), Value(kJuly14Text));
  EXPECT_EQ(log.plainLines()[1], "Received EMM Context is " + stored.description());
}

TEST_F(GsmNasConversionTest, LogsTheBearersBeforeTheirTimestampBecomesText) {
  KCellularActivatedBearerContexts bearers;
  bearers.setTimestamp(kJuly14);
  auto bearer = std::make_shared<BearerContext>();
  bearer->setCid(5);
  bearer->setApn("internet");
  bearers.addBearerContexts(bearer);
  deliver(V::K_CELLULAR_ACTIVE_BEARER, bearers);

  EXPECT_EQ(log.plainLines()[1],
            R"(Received Bearer Context Info is ["timestamp": 1500000000000, "bearer_contexts": )"
            R"([["cid": 5, "apn": "internet"]]])");
  EXPECT_EQ(*validator.myCellularActiveBearerDict()->find("timestamp"), Value(kJuly14Text));
  const List expected{Dictionary{{"cid", 5u}, {"apn", "internet"}, {"timestamp", kJuly14Text}}};
  EXPECT_EQ(validator.myCommon().activeBearer, expected);

  // A metric without bearer contexts leaves the list as it was.
  deliver(V::K_CELLULAR_ACTIVE_BEARER, KCellularActivatedBearerContexts());
  EXPECT_EQ(validator.myCommon().activeBearer, expected);
}

}  // namespace
}  // namespace store
