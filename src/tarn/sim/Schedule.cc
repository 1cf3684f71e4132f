#include "tarn/sim/Schedule.h"

#include <array>
#include <utility>

#include "tarn/sim/GsmReports.h"
#include "tarn/sim/LteReports.h"
#include "tarn/sim/NasReports.h"
#include "tarn/sim/SimFiles.h"
#include "tarn/sim/UmtsReports.h"

namespace tarn::sim::schedule {
namespace {

// Inter-RAT neighbours are measured once the serving cell falls below S_non_intra_search_P.
constexpr double kInterRatSearchDbm = -106.0;

bool onLte(const ReportContext& c) {
  const LteState& lte = c.phone.lte();
  return c.phone.rat() == Rat::Lte && lte.serving &&
         lte.rrc != messages::KCellularLteRrcState::KLTE_RRC_STATE_NULL;
}
bool lteConnected(const ReportContext& c) {
  return onLte(c) && c.phone.lte().connected();
}
bool lteAggregating(const ReportContext& c) {
  return lteConnected(c) && !c.phone.lte().secondaries.empty();
}
bool lteSearchingOtherRats(const ReportContext& c) {
  return onLte(c) && c.radio.lte()[*c.phone.lte().serving].rsrpDbm < kInterRatSearchDbm;
}
bool onUmts(const ReportContext& c) {
  return c.phone.rat() == Rat::Umts && c.phone.umts().serving;
}
bool umtsDedicated(const ReportContext& c) {
  return onUmts(c) && c.phone.umts().dedicated();
}
bool onGsm(const ReportContext& c) {
  return c.phone.rat() == Rat::Gsm && c.phone.gsm().serving;
}
bool gsmIdle(const ReportContext& c) {
  return onGsm(c) && !c.phone.gsm().dedicated;
}
bool gsmDedicated(const ReportContext& c) {
  return onGsm(c) && c.phone.gsm().dedicated;
}

service::Metric simFilesNow(const ReportContext& c) {
  return simFiles(c.network, c.subscriber, c.phone.nas(), c.atMs);
}

// Idle-mode GSM measures the serving cell on every fourth paging block (51-multiframes of
// 235 ms); a dedicated channel reports once per SACCH multiframe (480 ms).
constexpr std::array<Periodic, 13> kPeriodic = {{
    {1000, onLte, lte_reports::servingCellMeasurement},
    {1000, onLte, lte_reports::rsrpRsrqSinr},
    {1000, lteConnected, lte_reports::txPower},
    {1000, lteAggregating, lte_reports::secondaryCellMeasurement},
    {2000, lteAggregating, lte_reports::carrierAggregationStatus},
    {3000, onLte, lte_reports::neighbourMeasurement},
    {5000, lteSearchingOtherRats, lte_reports::interRatMeasurement},
    {1000, onUmts, umts_reports::servingCellMeasurement},
    {1000, umtsDedicated, umts_reports::txPower},
    {3000, onUmts, umts_reports::neighbourMeasurement},
    {940, gsmIdle, gsm_reports::idleServingMeasurement},
    {480, gsmDedicated, gsm_reports::csRfMeasurement},
    {3000, onGsm, gsm_reports::neighbourMeasurement},
}};

constexpr std::array<std::pair<Change, ReportBuilder>, 23> kOnChange = {{
    {Change::LteRrc, lte_reports::rrcState},
    {Change::LteCell, lte_reports::servingCellInfo},
    {Change::LteCell, lte_reports::selReselInfo},
    {Change::LteCell, lte_reports::componentCarriers},
    {Change::LteDrx, lte_reports::cdrxConfig},
    {Change::LteCarriers, lte_reports::componentCarriers},
    {Change::LteCarriers, lte_reports::carrierAggregationStatus},
    {Change::LteCaState, lte_reports::carrierAggregationStatus},
    {Change::LteRadioLinkFailure, lte_reports::radioLinkFailure},
    {Change::UmtsRrc, umts_reports::rrcState},
    {Change::UmtsRrc, umts_reports::rrcConfig},
    {Change::UmtsCell, umts_reports::servingCellInfo},
    {Change::UmtsCell, umts_reports::selReselInfo},
    {Change::GsmCell, gsm_reports::servingCellInfo},
    {Change::GsmCell, gsm_reports::idleConfig},
    {Change::GsmCell, gsm_reports::gprsConfig},
    {Change::GsmState, gsm_reports::servingCellInfo},
    {Change::Emm, nas_reports::emmContext},
    {Change::Mm, nas_reports::mmContext},
    {Change::Gmm, nas_reports::gmmContext},
    {Change::Bearers, nas_reports::activeBearers},
    {Change::MmCommon, nas_reports::mmCommonInfo},
    {Change::SimFiles, simFilesNow},
}};

}  // namespace

std::span<const Periodic> periodicReports() {
  return kPeriodic;
}

std::vector<ReportBuilder> reportsOf(Change change) {
  std::vector<ReportBuilder> builders;
  for (const auto& [when, build] : kOnChange) {
    if (when == change) builders.push_back(build);
  }
  return builders;
}

}  // namespace tarn::sim::schedule
