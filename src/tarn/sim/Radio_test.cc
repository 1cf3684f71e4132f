#include "tarn/sim/Radio.h"

#include <gtest/gtest.h>

#include "tarn/sim/Route.h"

namespace tarn::sim {
namespace {

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

}  // namespace
}  // namespace tarn::sim
