#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

#include "messages/Metrics.h"
#include "messages/Records.h"
#include "platform/Log.h"
#include "tarn/sim/Bands.h"
#include "tarn/sim/Drive.h"
#include "tarn/sim/Identity.h"
#include "tarn/sim/Nas.h"
#include "tarn/sim/Radio.h"
#include "tarn/sim/Random.h"
#include "tarn/sim/Route.h"
#include "tarn/sim/SimFiles.h"
#include "tarn/sim/Simulator.h"
#include "tarn/sim/SimulatorSource.h"
#include "tarn/testing/ManualClock.h"

namespace tarn::sim {

namespace {

TEST(ADrive, KeepsToTheRoadAndItsSpeedsStopsAtLightsAndDrivesOutAndBack) {
  Random random(4);
  Drive drive;
  bool stoppedInTown = false;
  bool reachedFarEnd = false;
  bool cameBack = false;
  for (int step = 0; step < 20 * 60 * 10; ++step) {
    drive.step(0.1, random);
    const double at = drive.positionM();
    ASSERT_GE(at, 0.0);
    ASSERT_LE(at, route::kLengthM);
    // The car slows down over a few seconds after entering a slower stretch.
    const double limitKmh = std::max({route::zoneAt(at - 150.0).maxKmh, route::zoneAt(at).maxKmh,
                                      route::zoneAt(at + 150.0).maxKmh});
    EXPECT_LE(drive.speedMps(), limitKmh / 3.6 + 0.01);
    if (drive.speedMps() == 0.0 && at > 1.0 && at < 2200.0) stoppedInTown = true;
    if (at > route::kLengthM - 1.0) reachedFarEnd = true;
    if (reachedFarEnd && at < 1.0) cameBack = true;
  }
  EXPECT_TRUE(stoppedInTown);
  EXPECT_TRUE(reachedFarEnd);
  EXPECT_TRUE(cameBack);
}

using Emm = messages::KCellularEmmContext;
using Gmm = messages::KCellularGmmContext;
using Procedure = Nas::Procedure;

class ANas : public ::testing::Test {
 protected:
  ANas()
      : network_(buildNetwork(random_)),
        radio_(network_),
        report_([this](Change change) { changes_.push_back(change); }),
        step_{1'000, 100.0, radio_, random_, report_} {}

  const LteCell& lteCell(std::uint32_t tac) const {
    return *std::find_if(network_.lte.begin(), network_.lte.end(),
                         [tac](const LteCell& cell) { return cell.tac == tac; });
  }
  std::vector<std::string> apns() const {
    std::vector<std::string> names;
    for (const Bearer& bearer : nas_.state().bearers)
      names.push_back(bearer.apn);
    return names;
  }

  Random random_{1};
  Network network_;
  Radio radio_;
  std::vector<Change> changes_;
  ChangeSink report_;
  Step step_;
  Nas nas_;
};

TEST_F(ANas, AttachesOnItsFirstLteCellWithAnInternetAndAnImsConnection) {
  const LteCell& city = lteCell(0x2A11);
  ASSERT_EQ(nas_.neededOn(city), Procedure::Attach);
  nas_.begin(step_, Procedure::Attach);
  EXPECT_EQ(nas_.state().emmStatus, Emm::KREG_STATUS_REGISTRATION_IN_PROGRESS);
  nas_.completeAttach(step_, city);

  const NasState& state = nas_.state();
  EXPECT_EQ(state.emmStatus, Emm::KREG_STATUS_NORMAL_SERVICE);
  EXPECT_EQ(state.trackingAreas, std::vector<std::uint32_t>{0x2A11});
  EXPECT_NE(state.guti.mTmsi, 0u);
  EXPECT_EQ(state.lac, city.lac);
  EXPECT_TRUE(state.combined);
  EXPECT_EQ(apns(), (std::vector<std::string>{"internet", "ims"}));
  EXPECT_EQ(state.bearers[0].address.size(), 20u);  // IPv4 and IPv6
  EXPECT_EQ(state.bearers[1].address.size(), 16u);
  EXPECT_EQ(changes_, (std::vector<Change>{Change::Emm, Change::Gmm, Change::Emm, Change::Mm,
                                           Change::Bearers, Change::MmCommon}));
  EXPECT_EQ(nas_.neededOn(city), Procedure::None);
}

TEST_F(ANas, UpdatesItsTrackingAreaOnANewTacAndAfterAnotherRat) {
  nas_.completeAttach(step_, lteCell(0x2A11));
  const LteCell& suburb = lteCell(0x2A12);
  ASSERT_EQ(nas_.neededOn(suburb), Procedure::TrackingAreaUpdate);
  nas_.completeTrackingAreaUpdate(step_, suburb);
  EXPECT_EQ(nas_.state().emmProcedure, Emm::EMM_PROC_TAU);
  EXPECT_EQ(nas_.neededOn(suburb), Procedure::None);

  const std::uint32_t mTmsi = nas_.state().guti.mTmsi;
  nas_.leftLte(step_);
  EXPECT_EQ(nas_.neededOn(suburb), Procedure::TrackingAreaUpdate);
  nas_.completeTrackingAreaUpdate(step_, suburb);
  EXPECT_EQ(nas_.state().emmProcedure, Emm::EMM_PROC_TAU_COMB);
  EXPECT_NE(nas_.state().guti.mTmsi, mTmsi);
}

TEST_F(ANas, RegistersInUmtsWithACombinedRoutingAreaUpdate) {
  nas_.completeAttach(step_, lteCell(0x2A11));
  const UmtsCell& country = network_.umts.back();
  ASSERT_EQ(nas_.neededOn(country), Procedure::RoutingAreaUpdate);
  nas_.completeRoutingAreaUpdate(step_, country.lac, country.rac, true);

  const NasState& state = nas_.state();
  EXPECT_EQ(state.gmmStatus, Emm::KREG_STATUS_NORMAL_SERVICE);
  EXPECT_EQ(state.gmmProcedure, Gmm::KNAS_MM_REG_PROC_COMBINED_RAU);
  EXPECT_EQ(state.routingLac, country.lac);
  EXPECT_EQ(state.lac, country.lac);
  EXPECT_NE(state.pTmsi, 0u);
  EXPECT_EQ(nas_.neededOn(country), Procedure::None);
}

TEST_F(ANas, UpdatesLocationThenRoutingAreaOnGsmAndDropsImsUntilBackOnLte) {
  const LteCell& city = lteCell(0x2A11);
  nas_.completeAttach(step_, city);
  const GsmCell& valley = network_.gsm.back();
  nas_.enteredGsm(step_);
  EXPECT_EQ(apns(), std::vector<std::string>{"internet"});

  ASSERT_EQ(nas_.neededOn(valley), Procedure::LocationAreaUpdate);
  nas_.completeLocationAreaUpdate(step_, valley.lac);
  EXPECT_FALSE(nas_.state().combined);
  ASSERT_EQ(nas_.neededOn(valley), Procedure::RoutingAreaUpdate);
  nas_.completeRoutingAreaUpdate(step_, valley.lac, valley.rac, false);
  EXPECT_EQ(nas_.state().gmmProcedure, Gmm::KNAS_MM_REG_PROC_ROUTING_AREA_UPDATE);
  EXPECT_EQ(nas_.neededOn(valley), Procedure::None);

  nas_.leftLte(step_);
  nas_.completeTrackingAreaUpdate(step_, city);
  EXPECT_EQ(apns(), (std::vector<std::string>{"internet", "ims"}));
  EXPECT_EQ(nas_.state().lac, city.lac);
  EXPECT_TRUE(nas_.state().combined);
}

class ARadio : public ::testing::Test {
 protected:
  ARadio() : network_(buildNetwork(random_)), radio_(network_) {}

  // The radio at `positionM`, with the slow fading drawn afresh.
  const Radio& at(double positionM) {
    radio_.update(positionM + 10'000.0, random_);  // far away first: no correlation
    radio_.update(positionM, random_);
    return radio_;
  }
  std::optional<std::size_t> bestLte() const {
    return radio_.bestLte([this](std::size_t i) { return network_.lte[i].anchor; });
  }
  std::optional<std::size_t> bestUmts() const {
    return radio_.bestUmts([](std::size_t) { return true; });
  }
  std::optional<std::size_t> bestGsm() const {
    return radio_.bestGsm([](std::size_t) { return true; });
  }

  Random random_{11};
  Network network_;
  Radio radio_;
};

TEST_F(ARadio, ReceivesACellMoreWeaklyFurtherFromItsSite) {
  const double siteM = network_.sites[network_.lte[0].site].alongM;
  const double nearDbm = at(siteM).lte()[0].rsrpDbm;
  const double farDbm = at(siteM + 1500.0).lte()[0].rsrpDbm;
  EXPECT_GT(nearDbm, farDbm + 20.0);
  EXPECT_LT(nearDbm, -50.0);
}

TEST_F(ARadio, KeepsTheSlowFadingWhileThePhoneStandsStill) {
  at(800.0);
  const double before = radio_.lte()[0].rsrpDbm;
  radio_.update(800.0, random_);
  EXPECT_DOUBLE_EQ(radio_.lte()[0].rsrpDbm, before);
}

TEST_F(ARadio, FindsEveryRatInTheCityAndNothingInTheUnderpass) {
  at(1000.0);
  EXPECT_TRUE(bestLte() && bestUmts() && bestGsm());
  at(2060.0);
  EXPECT_FALSE(bestLte() || bestUmts() || bestGsm());
}

TEST_F(ARadio, LosesLteBehindTheFirstRidgeAndUmtsBehindTheSecond) {
  at(4500.0);
  EXPECT_FALSE(bestLte());
  ASSERT_TRUE(bestUmts());
  EXPECT_GT(radio_.umts()[*bestUmts()].rscpDbm, -95.0);
  at(5900.0);
  EXPECT_TRUE(!bestUmts() || radio_.umts()[*bestUmts()].rscpDbm < -108.0);
  ASSERT_TRUE(bestGsm());
  EXPECT_GT(radio_.gsm()[*bestGsm()].rxlevDbm, -85.0);
}

TEST_F(ARadio, KeepsQualityFiguresWithinWhatAReceiverCanMeasure) {
  for (double positionM = 0.0; positionM <= route::kLengthM; positionM += 50.0) {
    radio_.update(positionM, random_);
    for (const LteLevel& level : radio_.lte()) {
      EXPECT_GE(level.rsrqDb, -19.5);
      EXPECT_LE(level.rsrqDb, -3.0);
      EXPECT_GE(level.sinrDb, -20.0);
      EXPECT_LE(level.sinrDb, 30.0);
      EXPECT_GT(level.rssiDbm, level.rsrpDbm + 20.0);  // a carrier holds hundreds of subcarriers
    }
    for (const UmtsLevel& level : radio_.umts()) {
      EXPECT_LE(level.ecnoDb, 0.0);
      EXPECT_GE(level.rssiDbm, -102.0);  // never below the receiver's noise
    }
  }
}

TEST_F(ARadio, RanksDetectableCellsStrongestFirst) {
  at(1250.0);
  const auto ranked = radio_.rankedLte(4, [](std::size_t) { return true; });
  ASSERT_EQ(ranked.size(), 4u);
  for (std::size_t i = 1; i < ranked.size(); ++i) {
    EXPECT_GE(radio_.lte()[ranked[i - 1]].rsrpDbm, radio_.lte()[ranked[i]].rsrpDbm);
  }
  EXPECT_EQ(ranked.front(), *radio_.bestLte([](std::size_t) { return true; }));
}

TEST(ARandom, FollowsTheReferenceSequenceOfXoshiro256StarStarSeededBySplitmix64) {
  Random random(0);
  EXPECT_EQ(random.next(), 0x99EC5F36CB75F2B4u);
  EXPECT_EQ(random.next(), 0xBF6E1F784956452Au);
  EXPECT_EQ(random.next(), 0x1A5F849D4933E6E0u);
}

TEST(ARandom, DrawsIntegersFromTheWholeClosedRange) {
  Random random(3);
  std::set<std::int64_t> drawn;
  for (int i = 0; i < 1000; ++i) {
    const std::int64_t value = random.between(-2, 2);
    ASSERT_GE(value, -2);
    ASSERT_LE(value, 2);
    drawn.insert(value);
  }
  EXPECT_EQ(drawn.size(), 5u);
}

TEST(ARandom, DrawsUniformNormalAndExponentialValuesWithTheirMoments) {
  Random random(5);
  constexpr int kSamples = 20000;
  double uniformSum = 0.0;
  double normalSum = 0.0;
  double normalSquares = 0.0;
  double exponentialSum = 0.0;
  for (int i = 0; i < kSamples; ++i) {
    const double unit = random.unit();
    ASSERT_GE(unit, 0.0);
    ASSERT_LT(unit, 1.0);
    uniformSum += random.uniform(10.0, 20.0);
    const double normal = random.normal(-3.0, 2.0);
    normalSum += normal;
    normalSquares += normal * normal;
    exponentialSum += random.exponential(4.0);
  }
  const double normalMean = normalSum / kSamples;
  EXPECT_NEAR(uniformSum / kSamples, 15.0, 0.1);
  EXPECT_NEAR(normalMean, -3.0, 0.05);
  EXPECT_NEAR(std::sqrt(normalSquares / kSamples - normalMean * normalMean), 2.0, 0.05);
  EXPECT_NEAR(exponentialSum / kSamples, 4.0, 0.1);
}

using platform::Bytes;

TEST(IdentityEncoding, PutsPlmnDigitsInNasOrderWithFillerForTwoDigitMncs) {
  EXPECT_EQ(identity::encodePlmn({1, 1, 2}), (Bytes{0x00, 0xF1, 0x10}));
  EXPECT_EQ(identity::encodePlmn({310, 260, 3}), (Bytes{0x13, 0x00, 0x62}));
}

TEST(IdentityEncoding, WritesImsisWithOddParityAndIccidsInSwappedBcdWithALuhnDigit) {
  EXPECT_EQ(identity::encodeImsi("001010123456789"),
            (Bytes{0x08, 0x09, 0x10, 0x10, 0x10, 0x32, 0x54, 0x76, 0x98}));
  EXPECT_EQ(identity::encodeSwappedBcd("8901", 3), (Bytes{0x98, 0x10, 0xFF}));
  EXPECT_EQ(identity::encodeSwappedBcd("123", 2), (Bytes{0x21, 0xF3}));
  EXPECT_EQ(identity::luhnCheckDigit("7992739871"), '3');
}

TEST(ASubscriber, HasAnImsiOfTheHomeNetworkAndAValidIccid) {
  Random random(42);
  const Subscriber subscriber = makeSubscriber({1, 1, 2}, random);
  ASSERT_EQ(subscriber.imsi.size(), 15u);
  EXPECT_EQ(subscriber.imsi.substr(0, 5), "00101");
  ASSERT_EQ(subscriber.iccid.size(), 19u);
  EXPECT_EQ(subscriber.iccid.substr(0, 2), "89");
  const std::string body = subscriber.iccid.substr(0, 18);
  EXPECT_EQ(identity::luhnCheckDigit(body), subscriber.iccid.back());
}

using namespace messages;
namespace id = messages::metric;
using namespace std::chrono_literals;

constexpr std::uint64_t kSimulatorStartMs = 1'700'000'000'000;
constexpr std::uint64_t kTenMinutesMs = 600'000;

std::vector<TimedMetric> driveFor(std::uint64_t seed, std::uint64_t ms) {
  Simulator simulator(seed, kSimulatorStartMs);
  return simulator.advance(ms);
}

bool sameStream(const std::vector<TimedMetric>& a, const std::vector<TimedMetric>& b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](const auto& x, const auto& y) {
    return x.atMs == y.atMs && x.metric.metricId == y.metric.metricId &&
           x.metric.payload == y.metric.payload;
  });
}

// Field 1 of every record is its timestamp; records are written in field order.
std::uint64_t leadingTimestamp(const platform::Bytes& payload) {
  if (payload.empty() || payload[0] != 0x08) return 0;
  std::uint64_t value = 0;
  for (std::size_t i = 1, shift = 0; i < payload.size() && shift < 64; ++i, shift += 7) {
    value |= static_cast<std::uint64_t>(payload[i] & 0x7F) << shift;
    if ((payload[i] & 0x80) == 0) break;
  }
  return value;
}

template <class Record>
std::shared_ptr<Record> decode(const service::Metric& metric) {
  platform::log::Capture quiet;  // field 19 of some records is logged as a metric-ID tag
  return Record::initWithData(&metric.payload);
}

TEST(ASimulator, ProducesTheSameBytesForTheSameSeedAndOthersForAnother) {
  const auto first = driveFor(3, 120'000);
  EXPECT_TRUE(sameStream(first, driveFor(3, 120'000)));
  EXPECT_FALSE(sameStream(first, driveFor(4, 120'000)));
}

TEST(ASimulator, GivesTheSameStreamHoweverTimeIsSliced) {
  const auto whole = driveFor(5, 60'000);
  Simulator sliced(5, kSimulatorStartMs);
  std::vector<TimedMetric> pieces;
  for (std::uint64_t slice : {37u, 250u, 1u, 999u}) {
    for (int i = 0; i < 15; ++i) {
      auto part = sliced.advance(slice);
      pieces.insert(pieces.end(), part.begin(), part.end());
    }
  }
  auto rest = sliced.advance(60'000 - 15 * (37 + 250 + 1 + 999));
  pieces.insert(pieces.end(), rest.begin(), rest.end());
  EXPECT_TRUE(sameStream(whole, pieces));
  EXPECT_EQ(sliced.nowMs(), kSimulatorStartMs + 60'000);
}

// One drive shared by the tests below: out of the city, through the countryside into the
// GSM-only valley, and back.
class TenMinuteDrive : public ::testing::Test {
 protected:
  static const std::vector<TimedMetric>& all() {
    static const std::vector<TimedMetric> metrics = driveFor(7, kTenMinutesMs);
    return metrics;
  }
  static std::vector<TimedMetric> only(std::uint32_t metricId) {
    std::vector<TimedMetric> matching;
    std::copy_if(all().begin(), all().end(), std::back_inserter(matching),
                 [metricId](const TimedMetric& m) { return m.metric.metricId == metricId; });
    return matching;
  }
  template <class Record>
  static std::vector<std::shared_ptr<Record>> records(std::uint32_t metricId) {
    std::vector<std::shared_ptr<Record>> decoded;
    for (const TimedMetric& m : only(metricId))
      decoded.push_back(decode<Record>(m.metric));
    return decoded;
  }
};

TEST_F(TenMinuteDrive, DeliversEveryMetricKindInTimeOrderStampedWithItsDeliveryTime) {
  std::set<std::uint32_t> seen;
  std::uint64_t previous = kSimulatorStartMs;
  for (const TimedMetric& m : all()) {
    seen.insert(m.metric.metricId);
    EXPECT_GE(m.atMs, previous);
    previous = m.atMs;
    EXPECT_EQ(leadingTimestamp(m.metric.payload), m.atMs) << std::hex << m.metric.metricId;
  }
  for (const MetricKind& kind : kMetricKinds) {
    EXPECT_TRUE(seen.contains(kind.metricID)) << kind.name;
  }
}

TEST_F(TenMinuteDrive, RepeatsMeasurementsAtTheirBasebandPeriods) {
  const std::map<std::uint32_t, std::uint64_t> periods = {
      {id::KCellularLteServingCellMeasurement, 1000}, {id::KCellularLteRsrpRsrqSinr, 1000},
      {id::KCellularLteNbrEutraCellMeas, 3000},       {id::KCellularWcdmaScellMeasurement, 1000},
      {id::KCellularWcdmaNbrCellMeas, 3000},          {id::KCellularGsmIdleScellMeasurement, 940},
      {id::KCellularGsmCsRfMeasurement, 480}};
  for (const auto& [metricId, period] : periods) {
    const auto reports = only(metricId);
    ASSERT_GT(reports.size(), 4u) << std::hex << metricId;
    // Apart from pauses while a measurement does not apply, reports follow the period.
    std::size_t onTime = 0;
    for (std::size_t i = 1; i < reports.size(); ++i) {
      const std::uint64_t gap = reports[i].atMs - reports[i - 1].atMs;
      if (gap + 20 >= period && gap <= period + 20) ++onTime;
    }
    EXPECT_GE(onTime, (reports.size() - 1) * 9 / 10) << std::hex << metricId;
  }
}

TEST_F(TenMinuteDrive, ReportsRrcStatesOnlyWhenTheyChange) {
  const auto lte = records<KCellularLteRrcState>(id::KCellularLteRrcState);
  for (std::size_t i = 1; i < lte.size(); ++i) {
    EXPECT_NE(lte[i]->state(), lte[i - 1]->state());
    EXPECT_EQ(lte[i]->prevState(), lte[i - 1]->state());
  }
  const auto umts = records<KCellularWcdmaRrcConnectionState>(id::KCellularWcdmaRrcConnectionState);
  for (std::size_t i = 1; i < umts.size(); ++i)
    EXPECT_NE(umts[i]->state(), umts[i - 1]->state());
}

TEST_F(TenMinuteDrive, SendsPayloadsThatDecodeWithTheRecordOfTheirMetric) {
  platform::log::Capture quiet;  // field 19 of some records is logged as a metric-ID tag
  for (const TimedMetric& m : all()) {
    const auto* kind = std::ranges::find(kMetricKinds, m.metric.metricId, &MetricKind::metricID);
    ASSERT_NE(kind, kMetricKinds.end()) << std::hex << m.metric.metricId;
    if (kind->recordClass.empty()) continue;  // the radio link failure has no record
    const auto record = recordClassNamed(kind->recordClass)->create();
    codec::Reader reader(m.metric.payload);
    EXPECT_TRUE(record->readFrom(reader)) << std::hex << m.metric.metricId;
  }
}

bool inLteBand(std::uint32_t band, std::uint32_t earfcn) {
  const bands::LteBand& plan = bands::lteBand(band);
  return earfcn >= plan.dlFirstEarfcn && earfcn <= plan.dlLastEarfcn;
}

TEST_F(TenMinuteDrive, ReportsLteCellsAndLevelsInTheirPhysicalRanges) {
  for (const auto& info : records<KCellularLteScellInfo>(id::KCellularLteScellInfo)) {
    EXPECT_LT(info->phyCellId(), 504u);
    EXPECT_TRUE(inLteBand(info->freqBandInd(), info->dlFreq()));
    EXPECT_EQ(info->ulFreq(), bands::lteUlEarfcn(info->freqBandInd(), info->dlFreq()));
  }
  for (const auto& meas : records<KCellularLteNbrEutraCellMeas>(id::KCellularLteNbrEutraCellMeas)) {
    for (const auto& cell : meas->measNbrEutras()) {
      EXPECT_LT(cell->nbrPhysCellId(), 504u);
      EXPECT_TRUE(inLteBand(cell->freqBandInd(), cell->nbrEarfcn()));
      EXPECT_TRUE(cell->nbrRsrp() >= 0 && cell->nbrRsrp() <= 97);
      EXPECT_TRUE(cell->nbrRsrq() >= 0 && cell->nbrRsrq() <= 34);
    }
  }
  for (const auto& status :
       records<KCellularLteCarrierAggregationStatus>(id::KCellularLteCarrierAggregationStatus)) {
    for (const auto& scc : status->sccLists()) {
      EXPECT_TRUE(inLteBand(scc->dlRfBand(), scc->dlEarfcn()));
      EXPECT_LE(scc->dlBandwidth(), 5u);
      EXPECT_TRUE(scc->rsrp() >= -14000 && scc->rsrp() <= -4400) << scc->rsrp();
    }
  }
}

TEST_F(TenMinuteDrive, ReportsUmtsAndGsmCellsAndLevelsInTheirPhysicalRanges) {
  for (const auto& info : records<KCellularWcdmaCellInfo>(id::KCellularWcdmaCellInfo)) {
    EXPECT_LT(info->psc(), 512u);
    const bands::UmtsBand& band =
        bands::umtsBand(info->wcdmaBand() == SYS_BAND_WCDMA_I_IMT_2000 ? 1 : 8);
    EXPECT_TRUE(info->dlUarfcn() >= band.dlFirstUarfcn && info->dlUarfcn() <= band.dlLastUarfcn);
  }
  for (const auto& meas : records<KCellularWcdmaNbrCellMeas>(id::KCellularWcdmaNbrCellMeas)) {
    for (const auto& cell : meas->measUtraResults()) {
      EXPECT_TRUE(cell->rscp() >= 0 && cell->rscp() <= 91);
      EXPECT_LE(cell->ecno(), 49u);
    }
    for (const auto& cell : meas->measGsmResults())
      EXPECT_LE(cell->rxlev(), 63u);
  }
  for (const auto& info : records<KCellularGsmScellInfo>(id::KCellularGsmScellInfo)) {
    const bands::GsmBand& band = bands::gsmBand(info->gsmBand());
    EXPECT_TRUE(info->arfcn() >= band.firstArfcn && info->arfcn() <= band.lastArfcn);
    EXPECT_LT(info->bsic(), 64u);
  }
  for (const auto& meas : records<KCellularGsmCsRfMeasurement>(id::KCellularGsmCsRfMeasurement)) {
    EXPECT_LE(meas->csRxlevSub(), 63u);
    EXPECT_LE(meas->csRxqualSub(), 7u);
  }
}

TEST_F(TenMinuteDrive, HandsOverBetweenCellsAndCarriers) {
  std::set<std::uint32_t> pcis;
  std::set<std::uint32_t> earfcns;
  for (const auto& info : records<KCellularLteScellInfo>(id::KCellularLteScellInfo)) {
    pcis.insert(info->phyCellId());
    earfcns.insert(info->dlFreq());
  }
  EXPECT_GE(pcis.size(), 3u);
  EXPECT_EQ(earfcns, (std::set<std::uint32_t>{1300, 6300}));
}

TEST_F(TenMinuteDrive, ActivatesCarrierAggregationAndDeactivatesItAgain) {
  bool activated = false;
  bool deactivatedAfterwards = false;
  for (const auto& status :
       records<KCellularLteCarrierAggregationStatus>(id::KCellularLteCarrierAggregationStatus)) {
    for (const auto& scc : status->sccLists()) {
      if (scc->state() == SecondaryComponentCarrier::SCC_STATE_ACTIVATED) activated = true;
      if (activated && scc->state() != SecondaryComponentCarrier::SCC_STATE_ACTIVATED) {
        deactivatedAfterwards = true;
      }
    }
  }
  EXPECT_TRUE(activated);
  EXPECT_TRUE(deactivatedAfterwards);
}

TEST_F(TenMinuteDrive, FallsBackToUmtsThenGsmAndReturnsToLte) {
  const std::map<std::uint32_t, char> rats = {{id::KCellularLteScellInfo, 'L'},
                                              {id::KCellularWcdmaCellInfo, 'U'},
                                              {id::KCellularGsmScellInfo, 'G'}};
  std::string path;
  for (const TimedMetric& m : all()) {
    const auto rat = rats.find(m.metric.metricId);
    if (rat != rats.end() && (path.empty() || path.back() != rat->second)) path += rat->second;
  }
  ASSERT_EQ(path.substr(0, 3), "LUG") << path;
  EXPECT_NE(path.find("UL", 3), std::string::npos) << path;
}

TEST_F(TenMinuteDrive, ConnectsReleasesAndRecoversWithRealisticCauses) {
  using Rrc = KCellularLteRrcState;
  std::set<std::pair<int, int>> transitions;  // state and cause
  for (const auto& report : records<Rrc>(id::KCellularLteRrcState)) {
    transitions.insert({report->state(), report->cause()});
  }
  for (const auto& expected : std::vector<std::pair<int, int>>{
           {Rrc::KLTE_RRC_STATE_CONNECTED, Rrc::KLTE_RRC_CAUSE_EST_MO_SIGNAL},
           {Rrc::KLTE_RRC_STATE_CONNECTED, Rrc::KLTE_RRC_CAUSE_EST_MO_DATA},
           {Rrc::KLTE_RRC_STATE_ENDING, Rrc::KLTE_RRC_CAUSE_REL_OTHER},
           {Rrc::KLTE_RRC_STATE_IDLE, Rrc::KLTE_RRC_CAUSE_REL_OTHER},
           {Rrc::KLTE_RRC_STATE_ATMPT_CONNECTION, Rrc::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP},
       }) {
    EXPECT_TRUE(transitions.contains(expected)) << expected.first << " " << expected.second;
  }
  // Each radio link failure is followed by an attempt to re-establish.
  for (const TimedMetric& failure : only(id::KCellularLteRadioLinkFailure)) {
    const auto after = std::find_if(all().begin(), all().end(), [&](const TimedMetric& m) {
      return m.atMs >= failure.atMs && m.metric.metricId == id::KCellularLteRrcState;
    });
    ASSERT_NE(after, all().end());
    EXPECT_EQ(decode<Rrc>(after->metric)->cause(), Rrc::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP);
  }
}

TEST_F(TenMinuteDrive, RegistersAndMovesBearersWithTheRat) {
  std::vector<std::size_t> bearerCounts;
  for (const auto& report :
       records<KCellularActivatedBearerContexts>(id::KCellularActivatedBearerContexts)) {
    EXPECT_EQ(report->bearerContextCount(), report->bearerContextsCount());
    bearerCounts.push_back(report->bearerContextsCount());
  }
  // The IMS connection is dropped on GSM and set up again back on LTE.
  ASSERT_FALSE(bearerCounts.empty());
  EXPECT_EQ(bearerCounts.front(), 2u);
  EXPECT_NE(std::find(bearerCounts.begin(), bearerCounts.end(), 1u), bearerCounts.end());
  EXPECT_EQ(bearerCounts.back(), 2u);

  const auto emm = records<KCellularEmmContext>(id::KCellularEmmContext);
  EXPECT_EQ(emm.front()->regStatus(), KCellularEmmContext::KREG_STATUS_REGISTRATION_IN_PROGRESS);
  EXPECT_EQ(emm.back()->regStatus(), KCellularEmmContext::KREG_STATUS_NORMAL_SERVICE);
  std::set<int> routingProcedures;
  for (const auto& gmm : records<KCellularGmmContext>(id::KCellularGmmContext)) {
    routingProcedures.insert(gmm->regProc());
  }
  EXPECT_TRUE(routingProcedures.contains(KCellularGmmContext::KNAS_MM_REG_PROC_COMBINED_RAU));
  EXPECT_TRUE(
      routingProcedures.contains(KCellularGmmContext::KNAS_MM_REG_PROC_ROUTING_AREA_UPDATE));
}

TEST(TheSimFiles, HoldTheSubscriptionTheNasReports) {
  Simulator simulator(9, kSimulatorStartMs);
  const auto metrics = simulator.advance(5'000);
  const service::Metric query = simulator.simFiles();
  EXPECT_EQ(query.metricId, id::KCellularSimCardFiles);
  const auto files = decode<KCellularSimCardFiles>(query);
  ASSERT_TRUE(files);
  std::map<std::uint32_t, platform::Bytes> contents;
  for (const auto& file : files->efLists())
    contents[file->efId()] = *file->content();

  const auto common = std::find_if(metrics.begin(), metrics.end(), [](const TimedMetric& m) {
    return m.metric.metricId == id::KCellularMmCommonInfo;
  });
  ASSERT_NE(common, metrics.end());
  EXPECT_EQ(contents[ef::kImsi], *decode<KCellularMmCommonInfo>(common->metric)->imsi());

  std::string iccid;
  for (const std::uint8_t byte : contents[ef::kIccid]) {
    for (const int digit : {byte & 0x0F, byte >> 4}) {
      if (digit <= 9) iccid += static_cast<char>('0' + digit);
    }
  }
  ASSERT_EQ(iccid.size(), 19u);
  EXPECT_EQ(identity::luhnCheckDigit(iccid.substr(0, 18)), iccid.back());
  EXPECT_EQ(contents[ef::kAdministrativeData].back(), 2);  // two-digit MNC
  EXPECT_EQ(std::string(contents[ef::kServiceProviderName].begin() + 1,
                        contents[ef::kServiceProviderName].begin() + 13),
            "Test Network");
  // Once attached, the EPS location holds the GUTI's PLMN.
  EXPECT_EQ(platform::Bytes(contents[ef::kEpsLocation].begin() + 2,
                            contents[ef::kEpsLocation].begin() + 5),
            identity::encodePlmn({1, 1, 2}));
}

class Received {
 public:
  std::function<void(service::Metric)> sink() {
    return [this](service::Metric metric) {
      std::lock_guard lock(mutex_);
      metrics_.push_back(std::move(metric));
    };
  }
  std::vector<service::Metric> metrics() {
    std::lock_guard lock(mutex_);
    return metrics_;
  }

 private:
  std::mutex mutex_;
  std::vector<service::Metric> metrics_;
};

// Moves the clock on by `wall` in the worker's ticks, each time until the worker has delivered
// what came due.
void runFor(testing::ManualClock& clock, std::chrono::milliseconds wall) {
  for (auto passed = 0ms; passed < wall; passed += 20ms) {
    clock.awaitWaiter();
    clock.advance(20ms);
  }
  clock.awaitWaiter();
}

TEST(ASimulatorSource, RunsSimulatedTimeAtItsSpeedAndStopsDeliveringWhenStopped) {
  // At the fastest speed a tick is 200 s of simulated time, delivered in slices of 1 s.
  for (const double speed : {40.0, SimulatorSource::kFastest}) {
    const auto clock = std::make_shared<testing::ManualClock>();
    SimulatorSource source(2, speed, kSimulatorStartMs, clock);
    Received received;
    source.start(received.sink());
    runFor(*clock, 300ms);
    source.stop();

    const auto metrics = received.metrics();
    ASSERT_FALSE(metrics.empty()) << speed;
    const double simulatedMs =
        static_cast<double>(leadingTimestamp(metrics.back().payload) - kSimulatorStartMs);
    EXPECT_LE(simulatedMs, 300 * speed) << speed;
    // RSRP samples come every 1.75 s of simulated time.
    EXPECT_GT(simulatedMs, 300 * speed - 1750) << speed;

    clock->advance(1h);
    EXPECT_EQ(received.metrics().size(), metrics.size()) << speed;
  }
}

TEST(ASimulatorSource, ResumesTheDriveWhereItStopped) {
  const auto clock = std::make_shared<testing::ManualClock>();
  SimulatorSource source(2, 50.0, kSimulatorStartMs, clock);
  Received first;
  source.start(first.sink());
  runFor(*clock, 100ms);
  source.stop();
  Received second;
  source.start(second.sink());
  runFor(*clock, 100ms);
  source.stop();
  ASSERT_FALSE(first.metrics().empty());
  ASSERT_FALSE(second.metrics().empty());
  EXPECT_GE(leadingTimestamp(second.metrics().front().payload),
            leadingTimestamp(first.metrics().back().payload));
}

TEST(ASimulatorSource, RefusesASpeedThatIsNotAboveZero) {
  EXPECT_THROW(SimulatorSource(1, 0.0), std::invalid_argument);
  EXPECT_THROW(SimulatorSource(1, -2.0), std::invalid_argument);
}

TEST(ASimulatorSource, AnswersAQueryForTheSimFilesOnly) {
  SimulatorSource source(2, 1.0, kSimulatorStartMs);
  const auto files = source.query(messages::metric::KCellularSimCardFiles);
  ASSERT_TRUE(files);
  EXPECT_EQ(files->metricId, messages::metric::KCellularSimCardFiles);
  EXPECT_EQ(leadingTimestamp(files->payload), kSimulatorStartMs);
  EXPECT_FALSE(source.query(messages::metric::KCellularLteRrcState));
}

}  // namespace
}  // namespace tarn::sim
