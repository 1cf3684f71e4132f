#include "tarn/sim/GsmReports.h"

#include <algorithm>
#include <cmath>

#include "messages/Metrics.h"
#include "tarn/sim/Units.h"

namespace tarn::sim::gsm_reports {
namespace {

using namespace messages;

constexpr std::uint32_t kLayer1Idle = 1;
constexpr std::uint32_t kLayer1PacketTransfer = 2;
constexpr std::uint32_t kLayer1Dedicated = 3;

const GsmCell& servingCell(const ReportContext& context) {
  return context.network.gsm[*context.phone.gsm().serving];
}

double servingRxlevDbm(const ReportContext& context) {
  return context.radio.gsm()[*context.phone.gsm().serving].rxlevDbm;
}

// RXQUAL 0 (BER below 0.2 %) on a strong carrier, degrading towards 7 near sensitivity.
std::uint32_t rxqual(double rxlevDbm, Random& fading) {
  const double quality = (-88.0 - rxlevDbm) / 3.0 + fading.normal(0.0, 0.6);
  return static_cast<std::uint32_t>(std::clamp(std::round(quality), 0.0, 7.0));
}

bool isDcs(const GsmCell& cell) {
  return cell.band == SYS_BAND_GSM_DCS_1800;
}

}  // namespace

service::Metric servingCellInfo(const ReportContext& context) {
  const GsmCell& cell = servingCell(context);
  const Plmn& plmn = context.network.plmn;
  KCellularGsmScellInfo record;
  record.setTimestamp(context.atMs);
  record.setMcc(plmn.mcc);
  record.setMnc(plmn.mnc);
  record.setLac(cell.lac);
  record.setCellId(cell.ci);
  record.setGsmBand(cell.band);
  record.setArfcn(cell.arfcn);
  record.setBsic(cell.bsic);
  record.setState(context.phone.gsm().dedicated ? KCellularGsmScellInfo::DEDICATED_STATE
                                                : KCellularGsmScellInfo::NON_DEDICATED_STATE);
  record.setNumMncDigits(plmn.mncDigits);
  return metricOf(messages::metric::KCellularGsmScellInfo, record);
}

service::Metric idleConfig(const ReportContext& context) {
  const GsmCell& cell = servingCell(context);
  const Plmn& plmn = context.network.plmn;
  KCellularGsmIdleConfig record;
  record.setTimestamp(context.atMs);
  record.setArfcnBcch(cell.arfcn);
  record.setMcc(plmn.mcc);
  record.setMnc(plmn.mnc);
  record.setLac(cell.lac);
  record.setCi(cell.ci);
  record.setBsic(cell.bsic);
  record.setDtxFromBs(1);
  record.setRadioLinkTimeout(32);
  record.setMultibRep(0);
  record.setGsmBand(static_cast<std::uint32_t>(cell.band));
  record.setAccessTech(0);
  record.setTypeOfCurChan(0);
  record.setMsTxpwr(isDcs(cell) ? 0 : 5);  // power control level of 30 and 33 dBm
  record.setRxAccMin(6);                   // -104 dBm
  record.setCbq(0);
  record.setCba(0);
  record.setC2Valid(1);
  record.setCrOffset(0);
  record.setTmpOffset(0);
  record.setPenaltyT(0);
  record.setT3212(10);  // in tenths of an hour
  record.setAcc(0);
  record.setBsPaMfrms(2);
  record.setCsPagemode(0);
  record.setMaxRetransCs(4);
  record.setEmergCallAllowed(1);
  record.setAttachAllowed(1);
  record.setHalfRateSupported(1);
  record.setSi78Broadcast(0);
  record.setCbchSupported(0);
  record.setReestAllowed(1);
  record.setEcsc(1);
  record.setSi2TerNeeded(1);
  return metricOf(messages::metric::KCellularGsmIdleConfig, record);
}

service::Metric idleServingMeasurement(const ReportContext& context) {
  KCellularGsmIdleScellMeasurement record;
  record.setTimestamp(context.atMs);
  record.setScellArfcn(servingCell(context).arfcn);
  record.setSimplifiedL1State(context.traffic.active() ? kLayer1PacketTransfer : kLayer1Idle);
  record.setCurrentAntenna(0);
  const double rxlev = servingRxlevDbm(context) + context.fading.normal(0.0, 1.5);
  record.setIdleRxlevDBm(units::wholeDb(std::clamp(rxlev, -110.0, -47.0)));
  return metricOf(messages::metric::KCellularGsmIdleScellMeasurement, record);
}

service::Metric csRfMeasurement(const ReportContext& context) {
  const GsmCell& cell = servingCell(context);
  const double rxlev = servingRxlevDbm(context) + context.fading.normal(0.0, 1.0);
  // Power control backs off from the maximum in 2 dB steps as the downlink gets stronger.
  const double maximum = isDcs(cell) ? 30.0 : 33.0;
  const double target = std::clamp(maximum - 2.0 * std::floor((rxlev + 95.0) / 4.0), 5.0, maximum);
  KCellularGsmCsRfMeasurement record;
  record.setTimestamp(context.atMs);
  record.setScellArfcn(cell.arfcn);
  record.setSimplifiedL1State(kLayer1Dedicated);
  record.setCurrentAntenna(0);
  for (int sacch = 0; sacch < 4; ++sacch) {
    record.addCsTxPwr(units::wholeDb(std::min(maximum, target + 2.0 * (3 - sacch))));
  }
  record.setCsRxlevSub(units::rxlevIndex(rxlev));
  record.setCsRxqualSub(rxqual(rxlev, context.fading));
  record.setScellBand(static_cast<std::uint32_t>(cell.band));
  return metricOf(messages::metric::KCellularGsmCsRfMeasurement, record);
}

service::Metric neighbourMeasurement(const ReportContext& context) {
  const std::size_t serving = *context.phone.gsm().serving;
  const Plmn& plmn = context.network.plmn;
  const auto faded = [&context](double dbm) { return dbm + context.fading.normal(0.0, 1.5); };
  KCellularGsmGrrEventMeasCr record;
  record.setTimestamp(context.atMs);
  for (const std::size_t i :
       context.radio.rankedGsm(6, [serving](std::size_t i) { return i != serving; })) {
    const GsmCell& cell = context.network.gsm[i];
    auto neighbour = std::make_shared<GsmNcellMeas>();
    neighbour->setMcc(plmn.mcc);
    neighbour->setMnc(plmn.mnc);
    neighbour->setLac(cell.lac);
    neighbour->setCi(cell.ci);
    neighbour->setBsic(cell.bsic);
    neighbour->setArfcn(cell.arfcn);
    neighbour->setRxlev(units::rxlevIndex(faded(context.radio.gsm()[i].rxlevDbm)));
    record.addGsmNcellMeas(neighbour);
  }
  for (const std::size_t i : context.radio.rankedUmts(4, [](std::size_t) { return true; })) {
    const UmtsCell& cell = context.network.umts[i];
    const UmtsLevel& level = context.radio.umts()[i];
    auto neighbour = std::make_shared<UmtsNcellMeas>();
    neighbour->setCellType(0);  // FDD
    neighbour->setCpichSc(cell.psc);
    neighbour->setDlUarfcn(cell.dlUarfcn);
    neighbour->setCpichRscp(units::rscpIndex(faded(level.rscpDbm)));
    neighbour->setCpichEcn0(units::ecnoIndex(level.ecnoDb + context.fading.normal(0.0, 0.7)));
    record.addUmtsNcellMeas(neighbour);
  }
  const auto anchors = [&context](std::size_t i) { return context.network.lte[i].anchor; };
  for (const std::size_t i : context.radio.rankedLte(4, anchors)) {
    const LteCell& cell = context.network.lte[i];
    const LteLevel& level = context.radio.lte()[i];
    auto neighbour = std::make_shared<LteNcellMeas>();
    neighbour->setPhysicalCellId(cell.pci);
    neighbour->setBandwidth(cell.bandwidthCode);
    neighbour->setRsrp(units::rsrpIndex(faded(level.rsrpDbm)));
    neighbour->setEarfcn(cell.dlEarfcn);
    neighbour->setRsrq(units::rsrqIndex(level.rsrqDb + context.fading.normal(0.0, 0.7)));
    record.addLteNcellMeas(neighbour);
  }
  return metricOf(messages::metric::KCellularGsmGrrEventMeasCr, record);
}

service::Metric gprsConfig(const ReportContext& context) {
  KCellularGsmGprsConfig record;
  record.setTimestamp(context.atMs);
  record.setGprsSup(true);
  record.setRac(servingCell(context).rac);
  record.setSpPgCy(true);
  record.setNco(0);
  record.setNom(1);     // network operation mode II
  record.setCrHyst(2);  // 4 dB
  record.setAccThr(0);
  record.setExtUplTbfSupported(true);
  record.setPriorityClass(0);
  record.setCellBarAccess2(0);
  return metricOf(messages::metric::KCellularGsmGprsConfig, record);
}

}  // namespace tarn::sim::gsm_reports
