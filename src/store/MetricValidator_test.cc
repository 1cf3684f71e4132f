#include "store/MetricValidator.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>
#include <optional>
#include <tuple>
#include <vector>

#include "messages/Records.h"
#include "oracle/RandomMessage.h"
#include "store/StoreDump.h"
#include "store/StoreTesting.h"
#include "tarn/sim/Simulator.h"

namespace store {
namespace {

using messages::KCellularLteRrcState;
using platform::Bytes;
using platform::Dictionary;
using platform::Value;
using store::fixtures::kJuly14;
using store::fixtures::kJuly14Text;
using ::testing::ElementsAre;
using ::testing::StartsWith;

class MetricValidatorTest : public store::fixtures::StoreTest {
 protected:
  static KCellularLteRrcState rrcState() {
    KCellularLteRrcState state;
    state.setTimestamp(kJuly14);
    state.setState(KCellularLteRrcState::KLTE_RRC_STATE_CONNECTED);
    return state;
  }
};

TEST_F(MetricValidatorTest, StartsWithNoDictionariesAndPlaceholderRowsEverywhere) {
  for (std::size_t i = 0; i < kDisplayDictionaryCount; ++i) {
    EXPECT_FALSE(validator.displayDictionary(static_cast<DisplayDictionary>(i)))
        << kDisplayDictionaryNames[i];
  }
  const Dictionary placeholder{{"Waiting for Update", "Waiting for Update"}};
  const Dictionary dump = dumpStore(validator);
  for (const char* record : {"myLTE", "myUMTS", "myGSM", "myCommon"}) {
    for (const auto& [field, value] : *dump.find(record)->asDictionary()) {
      if (!value.isList()) continue;
      EXPECT_EQ(*value.asList(), platform::List{placeholder}) << record << "." << field;
    }
  }
  EXPECT_EQ(validator.myLTE().SelReselCellInfo.size(), 20u);
  EXPECT_EQ(validator.myUMTS().SelReselCellInfo.size(), 14u);
  for (const auto& reselection :
       {validator.myLTE().SelReselCellInfo, validator.myUMTS().SelReselCellInfo}) {
    for (const auto& [key, value] : reselection)
      EXPECT_EQ(value, Value("")) << key;
  }
  EXPECT_EQ(validator.myLTE().IMSI, Value("Come Back Later"));
  EXPECT_FALSE(validator.metricID());
}

TEST_F(MetricValidatorTest, StoresAKnownMetricAndSaysSoOnce) {
  deliver(MetricValidator::K_LTE_RRC_STATE, rrcState());
  const Dictionary expected{{"timestamp", kJuly14Text}, {"state", "KLTE_RRC_STATE_CONNECTED"}};
  EXPECT_EQ(validator.myLTERRCStateDict(), expected);
  EXPECT_EQ(validator.metricID(), 3952132);
  EXPECT_THAT(log.plainLines(), ElementsAre("Metric ID in Hex = 3C4E04",
                                            "Current RRC state is " + expected.description(),
                                            "Received Valid Metric"));
}

TEST_F(MetricValidatorTest, PassesOverMetricsWithoutAHandlerAndKeepsTheStore) {
  deliver(MetricValidator::K_LTE_RRC_STATE, rrcState());
  const Dictionary before = dumpStore(validator);
  for (const std::int64_t id : {MetricValidator::K_LTE_RLF, MetricValidator::K_LTE_SCELL_MEAS,
                                std::int64_t{1}, std::int64_t{-1}}) {
    log.clear();
    EXPECT_FALSE(validator.isMetricIDValidWithMetricdict(
        {{"kKeyMetricID", id}, {"kKeyPayload", rrcState().data()}}));
    EXPECT_EQ(validator.metricID(), id);
    EXPECT_EQ(log.plainLines().back(), "I dont care for this Metric");
    Dictionary after = dumpStore(validator);
    after.set("metricID", before.find("metricID")->asInteger().value());
    EXPECT_EQ(after, before) << id;
  }
  EXPECT_THAT(log.plainLines(),
              ElementsAre("Metric ID in Hex = FFFFFFFFFFFFFFFF", "I dont care for this Metric"));
}

TEST_F(MetricValidatorTest, WritesTheMetricIdInUpperCaseHexAtLeastTwoWide) {
  const struct {
    std::int64_t metricID;
    std::string_view line;
  } kCases[] = {
      {0, "Metric ID in Hex =  0"},
      {0xA, "Metric ID in Hex =  A"},
      {0x3CD30E, "Metric ID in Hex = 3CD30E"},
      {-1, "Metric ID in Hex = FFFFFFFFFFFFFFFF"},
      {std::numeric_limits<std::int64_t>::min(), "Metric ID in Hex = 8000000000000000"},
  };
  for (const auto& test : kCases) {
    log.clear();
    validator.metricsDidUpdate({{"kKeyMetricID", test.metricID}, {"kKeyPayload", Bytes{0xFF}}});
    EXPECT_EQ(log.plainLines().front(), test.line);
    EXPECT_EQ(platform::format("Metric ID in Hex = %2X", test.metricID), test.line);
  }
}

TEST_F(MetricValidatorTest, IgnoresRecordsWithoutAnIntegerMetricId) {
  deliver(MetricValidator::K_LTE_RRC_STATE, rrcState());
  const Dictionary before = dumpStore(validator);
  for (const Value& id : {Value(), Value("3C4E04"), Value(3952132.5), Value(Bytes{4})}) {
    log.clear();
    Dictionary record{{"kKeyPayload", rrcState().data()}};
    if (!id.isNull()) record.set("kKeyMetricID", id);
    validator.metricsDidUpdate(record);
    EXPECT_FALSE(validator.metricID());
    EXPECT_THAT(log.plainLines(),
                ElementsAre("The metric record has no integer \"kKeyMetricID\"; nothing to do"));
  }
  Dictionary after = dumpStore(validator);
  after.set("metricID", *before.find("metricID"));
  EXPECT_EQ(after, before);
}

TEST_F(MetricValidatorTest, KeepsThePreviousDataWhenAPayloadDoesNotDecode) {
  deliver(MetricValidator::K_LTE_RRC_STATE, rrcState());
  const auto stored = validator.myLTERRCStateDict();
  log.clear();
  // Field 2 announced as a varint that the payload cuts short.
  validator.metricsDidUpdate(
      {{"kKeyMetricID", MetricValidator::K_LTE_RRC_STATE}, {"kKeyPayload", Bytes{0x10, 0x80}}});
  EXPECT_EQ(validator.myLTERRCStateDict(), stored);
  EXPECT_THAT(log.plainLines(),
              ElementsAre("Metric ID in Hex = 3C4E04",
                          "The payload (2 bytes) does not decode as KCellularLteRrcState; "
                          "keeping the previous data"));
}

TEST_F(MetricValidatorTest, DecodesAMissingOrNonBytePayloadAsAnEmptyRecord) {
  for (const Value& payload : {Value(), Value("CAE=")}) {
    deliver(MetricValidator::K_LTE_RRC_STATE, rrcState());
    Dictionary record{{"kKeyMetricID", MetricValidator::K_LTE_RRC_STATE}};
    if (!payload.isNull()) record.set("kKeyPayload", payload);
    EXPECT_TRUE(validator.isMetricIDValidWithMetricdict(record));
    EXPECT_EQ(validator.myLTERRCStateDict(), Dictionary{});
  }
}

TEST_F(MetricValidatorTest, DoesNotCheckTheAppOrProfileId) {
  Dictionary record = metric(MetricValidator::K_LTE_RRC_STATE, rrcState());
  record.set("kKeyAppID", 99);
  record.set("kKeyProfileID", "none");
  EXPECT_TRUE(validator.isMetricIDValidWithMetricdict(record));
}

TEST_F(MetricValidatorTest, OnlyAcknowledgesEvents) {
  const Dictionary before = dumpStore(validator);
  validator.eventsDidUpdate({});
  validator.eventsDidUpdate(metric(MetricValidator::K_LTE_RRC_STATE, rrcState()));
  EXPECT_THAT(log.plainLines(), ElementsAre("I dont care for events", "I dont care for events"));
  EXPECT_EQ(dumpStore(validator), before);
}

TEST_F(MetricValidatorTest, ShowsTimestampsInTheCurrentTimeZone) {
  EXPECT_EQ(validator.formatTimestamp(0), "1970-01-01 00:00:00 UTC");
  EXPECT_EQ(validator.formatTimestamp(1500), validator.formatTimestamp(1000));
  deliver(MetricValidator::K_LTE_RRC_STATE, rrcState());
  EXPECT_EQ(*validator.myLTERRCStateDict()->find("timestamp"), Value(kJuly14Text));
  setenv("TZ", "America/New_York", 1);
  deliver(MetricValidator::K_LTE_RRC_STATE, rrcState());
  EXPECT_EQ(*validator.myLTERRCStateDict()->find("timestamp"), Value("2017-07-13 22:40:00 EDT"));
}

TEST_F(MetricValidatorTest, KeepsATimestampThatNoCalendarShowsAsItsNumber) {
  KCellularLteRrcState state;
  state.setTimestamp(UINT64_MAX);
  deliver(MetricValidator::K_LTE_RRC_STATE, state);
  EXPECT_EQ(*validator.myLTERRCStateDict()->find("timestamp"), Value(UINT64_MAX));
}

// A row is its element's entries in their order, then those it takes over from its metric, and
// the rows of each metric are written over the last ones whatever their shape was.
TEST_F(MetricValidatorTest, WritesEachRowAsItsElementThenWhatItTakesOverFromItsMetric) {
  using messages::KCellularWcdmaScellMeasurement;
  using messages::RxInfo;
  const auto rowTexts = [this] {
    std::vector<std::string> texts;
    for (const Value& row : validator.myUMTS().rXInfo)
      texts.push_back(row.description());
    return texts;
  };
  KCellularWcdmaScellMeasurement first;
  first.setTimestamp(kJuly14);
  first.setConnectedMode(true);
  for (const std::int32_t rssi : {-70, -72, -74}) {
    auto info = std::make_shared<RxInfo>();
    info->setRssi(rssi);
    info->setSnr(rssi + 80);
    first.addRxInfo(info);
  }
  deliver(MetricValidator::K_UMTS_SCELL_MEAS, first);
  KCellularWcdmaScellMeasurement second;
  second.setTimestamp(kJuly14 + 1000);
  for (const std::uint32_t range : {3u, 4u}) {
    auto info = std::make_shared<RxInfo>();
    info->setRsrpRange(range);
    info->setRsrqRange(range + 1);
    second.addRxInfo(info);
  }
  deliver(MetricValidator::K_UMTS_SCELL_MEAS, second);
  EXPECT_THAT(rowTexts(), ElementsAre(R"(["rsrp_range": 3, "rsrq_range": 4, )"
                                      R"("timestamp": "2017-07-14 02:40:01 UTC"])",
                                      R"(["rsrp_range": 4, "rsrq_range": 5, )"
                                      R"("timestamp": "2017-07-14 02:40:01 UTC"])"));
  deliver(MetricValidator::K_UMTS_SCELL_MEAS, first);
  EXPECT_THAT(rowTexts(),
              ElementsAre(R"(["rssi": -70, "snr": 10, "timestamp": "2017-07-14 02:40:00 UTC", )"
                          R"("connected_mode": 1])",
                          R"(["rssi": -72, "snr": 8, "timestamp": "2017-07-14 02:40:00 UTC", )"
                          R"("connected_mode": 1])",
                          R"(["rssi": -74, "snr": 6, "timestamp": "2017-07-14 02:40:00 UTC", )"
                          R"("connected_mode": 1])"));
}

struct Route {
  std::int64_t metricID;
  const char* recordClass;
  DisplayDictionary display;
  const char* logPrefix;
};

using V = MetricValidator;
using D = DisplayDictionary;
constexpr Route kRoutes[] = {
    {V::K_LTE_RRC_STATE, "KCellularLteRrcState", D::LTERRCState, "Current RRC state is "},
    {V::K_LTE_CDRX_CONFIG, "KCellularLteCdrxConfig", D::LTECDRXConfig, "Current CDRX Config is "},
    {V::K_LTE_SCELL_INFO, "KCellularLteScellInfo", D::LTESCellInfo,
     "Current Serving Cell Info is "},
    {V::K_LTE_SEL_RESEL_INFO, "KCellularLteSelReselCellInfo", D::LTESelResel,
     "Received LTE Cell Resel Info is "},
    {V::K_LTE_RSRP_RSRQ_SINR, "KCellularLteRsrpRsrqSinr", D::LTERsrpRsrqSinr,
     "Received RSRP RSRQ SINR is : "},
    {V::K_LTE_TX_POWER, "KCellularLteTxPower", D::LTETxPower, "Received LTE Tx Power is "},
    {V::K_LTE_COMPCARR_INFO, "KCellularLteComponentCarrierInfo", D::LTECompCarr,
     "Received Component Carrier info is "},
    {V::K_LTE_CA_STATUS, "KCellularLteCarrierAggregationStatus", D::LTECAStatus,
     "Received CA Status Dict is "},
    {V::K_LTE_SECONDARYCELL_MEAS, "KCellularLteSecondaryCellMeasurements", D::LTESecondaryCellMeas,
     "Received Secondary Cell Measurement Dict is "},
    {V::K_LTE_INTRARAT_MEAS, "KCellularLteNbrEutraCellMeas", D::LTEIntraRatMeas,
     "Received LTE IRAT Meas is "},
    {V::K_LTE_INTERRAT_MEAS, "KCellularLteNbrInterRatCellMeas", D::LTEInterRatMeas,
     "Received LTE InterRat Meas Info is "},
    {V::K_UMTS_RRC_STATE, "KCellularWcdmaRrcConnectionState", D::UMTSRRCState,
     "Received UMTS RRC Connection State is "},
    {V::K_UMTS_RRC_CONFIG, "KCellularWcdmaRrcConfiguration", D::UMTSRRCConfig,
     "Received UMTS RRC Configuration is "},
    {V::K_UMTS_SCELL_INFO, "KCellularWcdmaCellInfo", D::UMTSCellInfo,
     "Received UMTS Serving Cell Info is "},
    {V::K_UMTS_SCELL_MEAS, "KCellularWcdmaScellMeasurement", D::UMTSCellMeas,
     "Received UMTS Serving Cell Meas is "},
    {V::K_UMTS_TX_POWER, "KCellularWcdmaTxPower", D::UMTSTxPower, "Received Tx Power is "},
    {V::K_UMTS_SEL_RESEL_INFO, "KCellularWcdmaSelReselCellInfo", D::UMTSSelResel,
     "Received UMTS Cell Resel Info is "},
    {V::K_UMTS_NCELL_MEAS, "KCellularWcdmaNbrCellMeas", D::UMTSNbrMeas,
     "Received UMTS InterRat Meas Info is "},
    {V::K_GSM_SCELL_INFO, "KCellularGsmScellInfo", D::GSMScellInfo,
     "Received GSM Serving Cell Info "},
    {V::K_GSM_IDLE_CONFIG, "KCellularGsmIdleConfig", D::GSMIdleConfigInfo,
     "Received GSM Idle Config Info is "},
    {V::K_GSM_IDLE_SCELL_MEAS, "KCellularGsmIdleScellMeasurement", D::GSMIdleScellMeas,
     "Received GSM Idle Serving Cell Meas Info is "},
    {V::K_GSM_CS_RF_MEAS, "KCellularGsmCsRfMeasurement", D::GSMConnRfMeas,
     "Received GSM Connected Serving Cell Meas Info is "},
    {V::K_GSM_NCELL_MEAS, "KCellularGsmGrrEventMeasCr", D::GSMNbrMeas,
     "Received GSM Nbr Cell Meas Info is "},
    {V::K_GSM_GPRS_CONFIG, "KCellularGsmGprsConfig", D::GSMGPRSConfig,
     "Received GSM GPRS Config Info is "},
    {V::K_CELLULAR_MM_INFO, "KCellularMmCommonInfo", D::CellularMMCommonInfo,
     "Received MM Common Info Dict is : "},
    {V::K_CELLULAR_MM_CTXT, "KCellularMmContext", D::MMContext, "Received MM Context Info is "},
    {V::K_CELLULAR_GMM_CTXT, "KCellularGmmContext", D::GMMContext, "Received GMM Context Info is "},
    {V::K_LTE_EMM_CTXT, "KCellularEmmContext", D::LTEEMMContext, "Received EMM Context is "},
    {V::K_CELLULAR_ACTIVE_BEARER, "KCellularActivatedBearerContexts", D::CellularActiveBearer,
     "Received Bearer Context Info is "},
    {V::K_SIM_FILE_INFO, "KCellularSimCardFiles", D::SIMFileInfo,
     "Received SIM Card File Info is "},
};

// Whatever values a well-formed record of its class holds, extreme ones included, its metric
// is taken in whole: into its own display dictionary and no other, under its own log prefix.
TEST_F(MetricValidatorTest, TakesInAnyWellFormedRecordOfTheMetricsClass) {
  for (const Route& route : kRoutes) {
    for (std::uint64_t seed = 1; seed <= 40; ++seed) {
      const auto message = oracle::newMessageNamed(route.recordClass);
      ASSERT_TRUE(message) << route.recordClass;
      oracle::fillRandomly(*message, seed,
                           seed % 2 == 0 ? oracle::Fill::Full : oracle::Fill::Sparse);
      const std::string wire = message->SerializeAsString();
      MetricValidator fresh(nullptr);
      log.clear();
      fresh.metricsDidUpdate(
          {{"kKeyMetricID", route.metricID}, {"kKeyPayload", Bytes(wire.begin(), wire.end())}});
      for (std::size_t i = 0; i < kDisplayDictionaryCount; ++i) {
        const auto which = static_cast<DisplayDictionary>(i);
        ASSERT_EQ(fresh.displayDictionary(which).has_value(), which == route.display)
            << route.recordClass << " seed " << seed << ": " << memberName(which);
      }
      const auto lines = log.plainLines();
      ASSERT_THAT(lines, ::testing::Contains(StartsWith(route.logPrefix))) << route.recordClass;
      ASSERT_EQ(lines.back(), "Received Valid Metric") << route.recordClass << " seed " << seed;
    }
  }
}

// Lines made and written on a writer thread are those the intake writes itself, in the same
// order among the lines of other code, and the store ends up the same: a dictionary that a
// queued line still describes is not changed under it. A small queue makes the intake wait.
TEST_F(MetricValidatorTest, WritesTheSameLinesInTheSameOrderThroughAWriterThread) {
  // Five minutes of this drive bring every kind of metric the store converts, most of them many
  // times.
  tarn::sim::Simulator simulator(7, kJuly14);
  std::vector<Dictionary> records;
  for (const tarn::sim::TimedMetric& timed : simulator.advance(5 * 60 * 1000)) {
    records.push_back({{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                       {"kKeyPayload", timed.metric.payload}});
  }
  const auto takeIn = [&](std::optional<std::size_t> queueCapacity) {
    validator.clearStore();
    log.clear();
    std::optional<platform::log::WriterThread> writer;
    if (queueCapacity) writer.emplace(*queueCapacity);
    for (std::size_t i = 0; i < records.size(); ++i) {
      validator.metricsDidUpdate(records[i]);
      if (i % 5 == 0) platform::log::plainf("between metrics %zu", i);
      if (i % 9 == 0) platform::log::systemf("%s: MetricsTrigger dict=%zu", "listen", i);
      if (i % 97 == 0) platform::log::warningf("warning %zu", i);
    }
    writer.reset();
    return std::make_tuple(log.plainLines(), log.systemLines(), dumpStore(validator));
  };

  const auto direct = takeIn(std::nullopt);
  // Every handler runs, among them the three that change their dictionary after logging it
  // (the two reselections and the bearers).
  for (const Route& route : kRoutes) {
    EXPECT_THAT(std::get<0>(direct), ::testing::Contains(StartsWith(route.logPrefix)))
        << route.recordClass;
  }
  for (const std::size_t capacity : {std::size_t{1}, std::size_t{7}, std::size_t{4096}}) {
    const auto threaded = takeIn(capacity);
    EXPECT_EQ(std::get<0>(threaded), std::get<0>(direct)) << "capacity " << capacity;
    EXPECT_EQ(std::get<1>(threaded), std::get<1>(direct)) << "capacity " << capacity;
    EXPECT_EQ(std::get<2>(threaded), std::get<2>(direct)) << "capacity " << capacity;
  }
}

}  // namespace
}  // namespace store
