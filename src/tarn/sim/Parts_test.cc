#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <set>
#include <string>
#include <vector>

#include "tarn/sim/Drive.h"
#include "tarn/sim/Identity.h"
#include "tarn/sim/Nas.h"
#include "tarn/sim/Radio.h"
#include "tarn/sim/Random.h"
#include "tarn/sim/Route.h"

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

}  // namespace
}  // namespace tarn::sim
