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

TEST_F(UmtsReselectionTest, FillsOnlyThePriorityListsTheMetricCarries) {
  deliver(V::K_UMTS_SEL_RESEL_INFO, reselection());
  const UMTS& umts = validator.myUMTS();
  EXPECT_EQ(umts.eUtraNbrs, (List{Dictionary{{"earfcn", 1300u}, {"timestamp", kJuly14Text}}}));
  EXPECT_EQ(umts.utraNbrs, (List{Dictionary{{"uarfcn", 10700u}, {"timestamp", kJuly14Text}}}));
  EXPECT_EQ(umts.geraNbrs, placeholderList());
}

}  // namespace
}  // namespace store
