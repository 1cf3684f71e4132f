#include "tarn/sim/Nas.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

namespace tarn::sim {
namespace {

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

}  // namespace
}  // namespace tarn::sim
