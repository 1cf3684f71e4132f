// What a ModemManager modem reports, encoded by the source and taken in by the metric intake: the
// store must show ModemManager's own dBm and dB again, value by value.
#include <ModemManager.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <span>

#include "StoreValues.h"
#include "codec/Codable.h"
#include "store/StoreTesting.h"
#include "tarn/mm/Metrics.h"
#include "tarn/mm/Reading.h"

namespace {

using mmtest::Shown;
using mmtest::shownAt;
using platform::Dictionary;
using platform::List;
using store::MetricValidator;
using store::fixtures::kJuly14;
using store::fixtures::row;
using tarn::mm::Cell;
using tarn::mm::Problems;
using tarn::mm::Rat;
using tarn::mm::Snapshot;

class ModemManagerIntakeTest : public store::fixtures::StoreTest {
 protected:
  void take(const Snapshot& snapshot) {
    Problems problems;
    for (const tarn::service::Metric& metric :
         tarn::mm::radioMetrics(snapshot, kJuly14, problems)) {
      delivered.push_back(metric.metricId);
      validator.metricsDidUpdate(
          {{"kKeyMetricID", std::int64_t{metric.metricId}}, {"kKeyPayload", metric.payload}});
    }
    EXPECT_THAT(problems, ::testing::IsEmpty());
  }

  std::vector<std::uint32_t> delivered;
};

Cell cell(Rat rat, bool serving) {
  Cell cell;
  cell.rat = rat;
  cell.serving = serving;
  return cell;
}

void expectShown(const MetricValidator& store, std::span<const Shown> values) {
  for (const Shown& value : values)
    EXPECT_EQ(shownAt(store, value.path), value.expected) << value.path;
}

TEST_F(ModemManagerIntakeTest, ShowsAnLteModemsValuesAsModemManagerReportedThem) {
  Snapshot snapshot;
  Cell serving = cell(Rat::Lte, true);
  serving.pci = 416;
  serving.channel = 1300;
  serving.cellId = 0xD30156;
  serving.tac = 0x84CD;
  serving.plmn = tarn::mm::parsePlmn("21034");
  Cell lte = cell(Rat::Lte, false);
  lte.pci = 17;
  lte.channel = 6300;
  lte.rsrp = -105;
  lte.rsrq = -14.5;
  Cell umts = cell(Rat::Umts, false);
  umts.channel = 10700;
  umts.psc = 300;
  umts.rscp = -90;
  umts.ecio = -7.5;
  Cell gsm = cell(Rat::Gsm, false);
  gsm.channel = 62;
  gsm.bsic = 42;
  gsm.rxLevel = 30;
  snapshot.cells = {serving, lte, umts, gsm};
  snapshot.lte = {.rssi = -70, .rsrp = -97, .rsrq = -11, .snr = 12.5};
  snapshot.registration.state = MM_MODEM_3GPP_REGISTRATION_STATE_HOME;
  take(snapshot);

  const Shown shown[] = {
      {"myLTESCellInfoDict/phy_cell_id", 416},   {"myLTESCellInfoDict/tracking_area_code", 0x84CD},
      {"myLTESCellInfoDict/sel_plmn_mcc", 210},  {"myLTESCellInfoDict/sel_plmn_mnc", 34},
      {"myLTE/RsrpRsrqSinr/rsrp0", -97},         {"myLTE/RsrpRsrqSinr/rsrq0", -11},
      {"myLTE/RsrpRsrqSinr/sinr0", 12.5},        {"myLTE/EutraNbrsMeas/nbr_rsrp", -105},
      {"myLTE/EutraNbrsMeas/nbr_rsrq", -14.5},   {"myLTE/UtraNbrsMeas/rscp", -90},
      {"myLTE/UtraNbrsMeas/ecno", -7.5},         {"myLTE/GeraNbrsMeas/rxlev", -80},
      {"myLTESCellInfoDict/freq_band_ind", 3},    // EARFCN 1300
      {"myLTE/EutraNbrsMeas/freq_band_ind", 20},  // EARFCN 6300
  };
  expectShown(validator, shown);
  // The serving cell's tracking area, its PLMN 210-34 in NAS's three bytes.
  const platform::Value* tai = validator.myLTEEMMContextDict()->find("tai_list");
  ASSERT_NE(tai, nullptr);
  EXPECT_THAT(*tai->asString(), ::testing::HasSubstr("\"tac\": 33997"));
  const platform::Value* status = validator.myLTEEMMContextDict()->find("reg_status");
  ASSERT_NE(status, nullptr);
  EXPECT_EQ(*status->asString(), "KREG_STATUS_NORMAL_SERVICE");
  // Nothing that ModemManager does not report: no bandwidth, no second antenna.
  EXPECT_EQ(validator.myLTESCellInfoDict()->find("dl_bw"), nullptr);
  EXPECT_EQ(row(validator.myLTE().RsrpRsrqSinr, 0).find("rsrp1"), nullptr);
  EXPECT_FALSE(validator.myUMTSCellInfoDict());
}

TEST_F(ModemManagerIntakeTest, ShowsUmtsAndGsmModemsValuesAsModemManagerReportedThem) {
  Snapshot umts;
  Cell serving = cell(Rat::Umts, true);
  serving.channel = 10700;
  serving.psc = 300;
  serving.lac = 0x1F;
  serving.cellId = 0x2BAF;
  serving.plmn = tarn::mm::parsePlmn("310410");
  Cell lte = cell(Rat::Lte, false);
  lte.rsrp = -110;
  lte.rsrq = -16;
  Cell neighbour = cell(Rat::Umts, false);
  neighbour.channel = 10713;
  neighbour.rscp = -101;
  neighbour.ecio = -12.5;
  umts.cells = {serving, lte, neighbour};
  umts.umts = {.rssi = -60, .rscp = -85, .ecio = -6};
  take(umts);

  Snapshot gsm;
  Cell bcch = cell(Rat::Gsm, true);
  bcch.channel = 62;
  bcch.bsic = 42;
  bcch.rxLevel = 33;
  Cell gsmNeighbour = cell(Rat::Gsm, false);
  gsmNeighbour.rxLevel = 20;
  Cell umtsNeighbour = cell(Rat::Umts, false);
  umtsNeighbour.rscp = -106;
  umtsNeighbour.ecio = -21.5;
  Cell lteNeighbour = cell(Rat::Lte, false);
  lteNeighbour.rsrp = -120;
  lteNeighbour.rsrq = -18.5;
  gsm.cells = {bcch, gsmNeighbour, umtsNeighbour, lteNeighbour};
  take(gsm);

  const Shown shown[] = {
      {"myUMTSCellInfoDict/psc", 300},
      {"myUMTSCellInfoDict/dl_uarfcn", 10700},
      {"myUMTSCellInfoDict/mnc", 410},
      // A WCDMA receive measurement is shown as the baseband reports it: as indexes.
      {"myUMTS/rXInfo/rsrp_range", -85 + 116},
      {"myUMTS/rXInfo/rsrq_range", (-6 + 24.5) * 2},
      {"myUMTS/utraNbrMeas/rscp", -101},
      {"myUMTS/utraNbrMeas/ecno", -12.5},
      {"myUMTS/eUtraNbrMeas/rsrp", -110},
      {"myGSMScellInfoDict/arfcn", 62},
      {"myGSMIdleScellMeasDict/idle_rxlev_dBm", 33 - 110},
      {"myGSM/geraNbrMeas/rxlev", -90},
      {"myGSM/utraNbrMeas/cpich_rscp", -106},
      {"myGSM/utraNbrMeas/cpich_ecn0", -21.5},
      {"myGSM/eUtraNbrMeas/rsrp", -120},
  };
  expectShown(validator, shown);
  EXPECT_EQ(*validator.myUMTSCellInfoDict()->find("wcdma_band")->asString(),
            "SYS_BAND_WCDMA_I_IMT_2000");
  EXPECT_EQ(*validator.myGSMScellInfoDict()->find("gsm_band")->asString(), "SYS_BAND_GSM_PGSM_900");
}

TEST_F(ModemManagerIntakeTest, MakesNoRecordOfWhatModemManagerDoesNotReport) {
  take(Snapshot{});
  Snapshot noServingCell;
  noServingCell.registration.accessTechnologies = MM_MODEM_ACCESS_TECHNOLOGY_LTE;
  take(noServingCell);
  EXPECT_THAT(delivered, ::testing::IsEmpty());

  // Without a serving cell, the operator the modem registered on is all there is to show.
  Snapshot registeredOnly;
  registeredOnly.registration.accessTechnologies = MM_MODEM_ACCESS_TECHNOLOGY_UMTS;
  registeredOnly.registration.operatorPlmn = tarn::mm::parsePlmn("310410");
  take(registeredOnly);
  ASSERT_TRUE(validator.myUMTSCellInfoDict());
  const Shown shown[] = {{"myUMTSCellInfoDict/mcc", 310}, {"myUMTSCellInfoDict/mnc", 410}};
  expectShown(validator, shown);
  EXPECT_EQ(validator.myUMTSCellInfoDict()->find("psc"), nullptr);

  // A value that a baseband's index cannot carry is dropped, not clamped.
  Snapshot tooStrong;
  Cell neighbour = cell(Rat::Lte, false);
  neighbour.rsrp = -30;
  neighbour.pci = 5;
  tooStrong.cells = {neighbour};
  tooStrong.registration.accessTechnologies = MM_MODEM_ACCESS_TECHNOLOGY_LTE;
  Problems problems;
  tarn::mm::radioMetrics(tooStrong, kJuly14, problems);
  EXPECT_THAT(problems,
              ::testing::ElementsAre("neighbour RSRP -30 is outside what a baseband reports; "
                                     "dropped"));
}

TEST_F(ModemManagerIntakeTest, ShowsConnectedBearersAndTheirAddresses) {
  tarn::mm::Bearer bearer;
  bearer.apn = "internet";
  bearer.ipFamily = MM_BEARER_IP_FAMILY_IPV4;
  bearer.profileId = 1;
  bearer.ip4 = platform::Bytes{10, 1, 2, 3};
  bearer.dns = {platform::Bytes{8, 8, 8, 8}, platform::Bytes{1, 1, 1, 1}};
  const tarn::service::Metric metric = tarn::mm::bearerMetric({bearer}, kJuly14);
  validator.metricsDidUpdate(
      {{"kKeyMetricID", std::int64_t{metric.metricId}}, {"kKeyPayload", metric.payload}});
  const Dictionary context = row(validator.myCommon().activeBearer, 0);
  EXPECT_EQ(*context.find("apn")->asString(), "internet");
  EXPECT_EQ(*context.find("pdp_type")->asString(), "PDP_TYPE_IPv4");
  EXPECT_EQ(*context.find("pdp_addr")->asBytes(), (platform::Bytes{10, 1, 2, 3}));
  EXPECT_EQ(*context.find("secondary_dns_addr")->asBytes(), (platform::Bytes{1, 1, 1, 1}));
  const Shown shown[] = {{"myCommon/activeBearer/cid", 1},
                         {"myCellularActiveBearerDict/bearer_context_count", 1}};
  expectShown(validator, shown);
}

}  // namespace
