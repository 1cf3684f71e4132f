#include "tarn/sim/UmtsReports.h"

#include <algorithm>

#include "messages/Metrics.h"
#include "tarn/sim/Bands.h"
#include "tarn/sim/Units.h"

namespace tarn::sim::umts_reports {
namespace {

using namespace messages;
using Rrc = KCellularWcdmaRrcConnectionState;

constexpr double kNoiseFloorDbm = -101.2;
constexpr double kQRxLevMinDbm = -115.0;
constexpr double kQQualMinDb = -18.0;

const UmtsCell& servingCell(const ReportContext& context) {
  return context.network.umts[*context.phone.umts().serving];
}

const UmtsLevel& servingLevel(const ReportContext& context) {
  return context.radio.umts()[*context.phone.umts().serving];
}

bool connectedMode(UmtsRrc rrc) {
  return rrc == Rrc::KWCDMA_RRC_CONN_STATE_CELL_DCH || rrc == Rrc::KWCDMA_RRC_CONN_STATE_CELL_FACH;
}

}  // namespace

service::Metric rrcState(const ReportContext& context) {
  const UmtsState& umts = context.phone.umts();
  KCellularWcdmaRrcConnectionState record;
  record.setTimestamp(context.atMs);
  record.setState(umts.rrc);
  record.setEstablishmentCause(umts.establishment);
  record.setReleaseCause(umts.release);
  return metricOf(messages::metric::KCellularWcdmaRrcConnectionState, record);
}

service::Metric rrcConfig(const ReportContext& context) {
  const UmtsState& umts = context.phone.umts();
  const bool dedicated = umts.dedicated();
  // Dual-carrier HSDPA is deployed on the 2100 MHz layer only.
  const bool dualCarrier =
      dedicated && umts.serving && context.network.umts[*umts.serving].band == 1;
  KCellularWcdmaRrcConfiguration record;
  record.setTimestamp(context.atMs);
  record.setDrxCycleLengthMs(umts.rrc == Rrc::KWCDMA_RRC_CONN_STATE_URA_PCH ? 640
                             : connectedMode(umts.rrc)                      ? 0
                                                                            : 1280);
  record.setIsMimoConfigured(false);
  record.setIsDcConfigured(dualCarrier);
  return metricOf(messages::metric::KCellularWcdmaRrcConfiguration, record);
}

service::Metric servingCellInfo(const ReportContext& context) {
  const UmtsCell& cell = servingCell(context);
  const Plmn& plmn = context.network.plmn;
  KCellularWcdmaCellInfo record;
  record.setTimestamp(context.atMs);
  record.setMcc(plmn.mcc);
  record.setMnc(plmn.mnc);
  record.setLac(cell.lac);
  record.setCellId(cell.cellIdentity);
  record.setWcdmaBand(bands::umtsBand(cell.band).sysBand);
  record.setDlUarfcn(cell.dlUarfcn);
  record.setPsc(cell.psc);
  record.setNumMncDigits(plmn.mncDigits);
  record.setHspa(KCellularWcdmaCellInfo::SYS_HS_IND_HSDPA_HSUPA_SUPP_CELL);
  return metricOf(messages::metric::KCellularWcdmaCellInfo, record);
}

service::Metric servingCellMeasurement(const ReportContext& context) {
  const UmtsLevel& level = servingLevel(context);
  KCellularWcdmaScellMeasurement record;
  record.setTimestamp(context.atMs);
  record.setConnectedMode(connectedMode(context.phone.umts().rrc));
  for (int antenna = 0; antenna < 2; ++antenna) {
    const double rscp = level.rscpDbm + context.fading.normal(0.0, 1.5);
    auto info = std::make_shared<RxInfo>();
    info->setRssi(units::wholeDb(level.rssiDbm + context.fading.normal(0.0, 1.0)));
    info->setRsrpRange(units::rscpIndex(rscp));
    info->setRsrqRange(units::ecnoIndex(level.ecnoDb + context.fading.normal(0.0, 0.7)));
    info->setSnr(units::wholeDb(rscp - kNoiseFloorDbm));
    record.addRxInfo(info);
  }
  return metricOf(messages::metric::KCellularWcdmaScellMeasurement, record);
}

service::Metric txPower(const ReportContext& context) {
  const UmtsCell& cell = servingCell(context);
  // Open loop: CPICH transmit power minus RSCP is the path loss; the uplink interference and
  // the constant of the power control formula bring the total down by 113 dB.
  const double pathLossDb = cell.cpichDbm - kNetAntennaGainDb - servingLevel(context).rscpDbm;
  const double dataDb = context.traffic.demand() == Traffic::Demand::Heavy ? 4.0 : 0.0;
  KCellularWcdmaTxPower record;
  record.setTimestamp(context.atMs);
  for (std::uint32_t subframe = 0; subframe < 5; ++subframe) {
    const double total =
        std::clamp(pathLossDb - 113.0 + dataDb + context.fading.normal(0.0, 1.5), -50.0, 24.0);
    auto sample = std::make_shared<TxPowerInfo>();
    sample->setPucchTxPower(units::wholeDb(total - 6.0));  // the DPCCH
    sample->setPuschTxPower(units::wholeDb(total));
    sample->setSubframeIndex(subframe);
    record.addTxPowerInfo(sample);
  }
  return metricOf(messages::metric::KCellularWcdmaTxPower, record);
}

service::Metric selReselInfo(const ReportContext& context) {
  const UmtsCell& cell = servingCell(context);
  const UmtsLevel& level = servingLevel(context);
  KCellularWcdmaSelReselCellInfo record;
  record.setTimestamp(context.atMs);
  record.setHsdpaCapable(1);
  record.setEdchCapable(1);
  record.setDuplexMode(KCellularWcdmaSelReselCellInfo::FDD);
  record.setImsEmergencySupport(0);
  record.setCellBarred(0);
  record.setFachMeasOccInfoPresent(1);
  record.setSRxlev(units::wholeDb(level.rscpDbm - kQRxLevMinDbm));
  record.setSQual(units::wholeDb(level.ecnoDb - kQQualMinDb));
  record.setSIntrasearch(12);
  record.setSIntersearch(8);
  record.setSSearchRat(4);
  record.setSCellPrio(2);
  for (const auto& [earfcn, priority] : {std::pair{1300u, 5u}, std::pair{6300u, 4u}}) {
    auto frequency = std::make_shared<EutraFreqInfo>();
    frequency->setEarfcn(earfcn);
    frequency->setPrio(priority);
    record.addEutraPrioInfo(frequency);
  }
  auto own = std::make_shared<UtraFreqInfo>();
  own->setUarfcn(cell.dlUarfcn);
  own->setPrio(2);
  record.addUtraPrioInfo(own);
  for (const std::size_t i : context.radio.rankedGsm(4, [](std::size_t) { return true; })) {
    auto frequency = std::make_shared<GsmFreqInfo>();
    frequency->setArfcn(context.network.gsm[i].arfcn);
    frequency->setPrio(1);
    record.addGsmPrioInfo(frequency);
  }
  return metricOf(messages::metric::KCellularWcdmaSelReselCellInfo, record);
}

service::Metric neighbourMeasurement(const ReportContext& context) {
  const std::size_t serving = *context.phone.umts().serving;
  KCellularWcdmaNbrCellMeas record;
  record.setTimestamp(context.atMs);
  for (const std::size_t i :
       context.radio.rankedUmts(6, [serving](std::size_t i) { return i != serving; })) {
    const UmtsCell& cell = context.network.umts[i];
    const UmtsLevel& level = context.radio.umts()[i];
    auto result = std::make_shared<UtraCellMeasResult>();
    result->setUarfcn(cell.dlUarfcn);
    result->setBand(cell.band);
    result->setPsc(cell.psc);
    result->setEcno(units::ecnoIndex(level.ecnoDb + context.fading.normal(0.0, 0.7)));
    result->setRscp(static_cast<std::int32_t>(
        units::rscpIndex(level.rscpDbm + context.fading.normal(0.0, 1.5))));
    record.addMeasUtraResult(result);
  }
  for (const std::size_t i : context.radio.rankedGsm(6, [](std::size_t) { return true; })) {
    const GsmCell& cell = context.network.gsm[i];
    auto result = std::make_shared<GsmCellMeasResult>();
    result->setArfcn(cell.arfcn);
    result->setBsic(cell.bsic);
    result->setRxlev(
        units::rxlevIndex(context.radio.gsm()[i].rxlevDbm + context.fading.normal(0.0, 1.5)));
    record.addMeasGsmResult(result);
  }
  const auto anchors = [&context](std::size_t i) { return context.network.lte[i].anchor; };
  for (const std::size_t i : context.radio.rankedLte(4, anchors)) {
    const LteCell& cell = context.network.lte[i];
    const LteLevel& level = context.radio.lte()[i];
    auto result = std::make_shared<LteCellMeasResult>();
    result->setEarfcn(cell.dlEarfcn);
    result->setPhyCellId(cell.pci);
    result->setEutraBand(cell.band);
    result->setRsrp(static_cast<std::int32_t>(
        units::rsrpIndex(level.rsrpDbm + context.fading.normal(0.0, 1.5))));
    result->setRsrq(static_cast<std::int32_t>(
        units::rsrqIndex(level.rsrqDb + context.fading.normal(0.0, 0.7))));
    record.addMeasLteResult(result);
  }
  return metricOf(messages::metric::KCellularWcdmaNbrCellMeas, record);
}

}  // namespace tarn::sim::umts_reports
