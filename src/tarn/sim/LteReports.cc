#include "tarn/sim/LteReports.h"

#include <algorithm>
#include <array>
#include <cmath>

#include "codec/Writer.h"
#include "messages/Metrics.h"
#include "tarn/sim/Bands.h"
#include "tarn/sim/Units.h"

namespace tarn::sim::lte_reports {
namespace {

using namespace messages;
using units::centiDb;
using units::wholeDb;

constexpr std::uint32_t kInstantSamples = 5;
constexpr std::uint32_t kSamplePeriodMs = 200;

const LteCell& servingCell(const ReportContext& context) {
  return context.network.lte[*context.phone.lte().serving];
}

const LteLevel& servingLevel(const ReportContext& context) {
  return context.radio.lte()[*context.phone.lte().serving];
}

// One measured sample: the slow level plus fast fading, within the RSRP reporting range.
LteLevel sample(const LteLevel& level, Random& fading) {
  return {std::clamp(level.rsrpDbm + fading.normal(0.0, 1.5), -140.0, -44.0),
          std::clamp(level.rsrqDb + fading.normal(0.0, 0.7), -19.5, -3.0),
          std::clamp(level.sinrDb + fading.normal(0.0, 1.5), -20.0, 30.0),
          level.rssiDbm + fading.normal(0.0, 1.0)};
}

std::shared_ptr<RsrpRsrqSinr> rsrpRsrqSinrOf(std::uint32_t pci, const LteLevel& antenna0,
                                             const LteLevel& antenna1) {
  auto values = std::make_shared<RsrpRsrqSinr>();
  values->setPhyCellId(pci);
  values->setRsrp0(wholeDb(antenna0.rsrpDbm));
  values->setRsrp1(wholeDb(antenna1.rsrpDbm));
  values->setRsrq0(wholeDb(antenna0.rsrqDb));
  values->setRsrq1(wholeDb(antenna1.rsrqDb));
  values->setSinr0(units::halfDb(antenna0.sinrDb));
  values->setSinr1(units::halfDb(antenna1.sinrDb));
  return values;
}

// Open-loop uplink power control from the estimated path loss, capped at 23 dBm.
double uplinkPowerDbm(double nominalDbm, double pathLossFactor, double pathLossDb,
                      double bandwidthDb) {
  return std::clamp(nominalDbm + pathLossFactor * pathLossDb + bandwidthDb, -40.0, 23.0);
}

}  // namespace

service::Metric rrcState(const ReportContext& context) {
  const LteState& lte = context.phone.lte();
  KCellularLteRrcState record;
  record.setTimestamp(context.atMs);
  record.setState(lte.rrc);
  record.setPrevState(lte.previousRrc);
  record.setPrevStateDurMs(lte.previousDurationMs);
  record.setCause(lte.cause);
  return metricOf(messages::metric::KCellularLteRrcState, record);
}

service::Metric cdrxConfig(const ReportContext& context) {
  const LteState& lte = context.phone.lte();
  KCellularLteCdrxConfig record;
  record.setTimestamp(context.atMs);
  record.setRrcState(lte.rrc);
  const bool configured = lte.connected();
  record.setCellStatus(configured ? 1 : 0);
  record.setCdrxConfigStatus(configured ? 1 : 0);
  if (configured) {
    record.setOnDurationMs(10);
    record.setDrxInactivityMs(100);
    record.setDrxRetxTimerMs(8);
    record.setLongDrxCycleMs(320);
    record.setShortDrxCycleMs(40);
    record.setDrxShortCycleNum(4);
    record.setTransmissionMode(3);
  }
  return metricOf(messages::metric::KCellularLteCdrxConfig, record);
}

service::Metric radioLinkFailure(const ReportContext& context) {
  constexpr std::uint32_t kT310Expiry = 0;
  const LteCell& cell = servingCell(context);
  codec::Writer writer;
  writer.writeUint64(context.atMs, 1);
  writer.writeUint32(kT310Expiry, 2);
  writer.writeUint32(cell.pci, 3);
  writer.writeUint32(cell.dlEarfcn, 4);
  return {messages::metric::KCellularLteRadioLinkFailure, writer.take()};
}

service::Metric servingCellInfo(const ReportContext& context) {
  const LteCell& cell = servingCell(context);
  const Plmn& plmn = context.network.plmn;
  // The bandwidths go out as resource block counts (100 for 20 MHz).
  const std::uint32_t resourceBlocks = bands::lteBandwidth(cell.bandwidthCode).resourceBlocks;
  KCellularLteScellInfo record;
  record.setTimestamp(context.atMs);
  record.setPhyCellId(cell.pci);
  record.setDlFreq(cell.dlEarfcn);
  record.setUlFreq(bands::lteUlEarfcn(cell.band, cell.dlEarfcn));
  record.setDlBw(resourceBlocks);
  record.setUlBw(resourceBlocks);
  record.setCellId(cell.cellIdentity);
  record.setFreqBandInd(cell.band);
  record.setTrackingAreaCode(cell.tac);
  record.setNumMncDigits(plmn.mncDigits);
  record.setSelPlmnMcc(plmn.mcc);
  record.setSelPlmnMnc(plmn.mnc);
  return metricOf(messages::metric::KCellularLteScellInfo, record);
}

service::Metric selReselInfo(const ReportContext& context) {
  // SIB3 and SIB5 of the operator: 1800 MHz first, 800 MHz for coverage, 2600 MHz last.
  struct Layer {
    std::uint32_t band;
    std::uint32_t earfcn;
    std::uint32_t bandwidthCode;
    std::uint32_t priority;
  };
  constexpr std::array<Layer, 3> kLayers = {{{3, 1300, 5, 5}, {20, 6300, 3, 4}, {7, 3050, 5, 3}}};
  const LteCell& cell = servingCell(context);

  KCellularLteSelReselCellInfo record;
  record.setTimestamp(context.atMs);
  record.setImsEmergencySupport(1);
  record.setAcBarringForEmergency(0);
  record.setMoSignallingAcBarringFactor(0);
  record.setMoSignallingAcBarringTime(0);
  record.setMoSignallingAcBarringForSpecialAc(0);
  record.setMoDataAcBarringFactor(0);
  record.setMoDataAcBarringTime(0);
  record.setMoDataAcBarringForSpecialAc(0);
  record.setQRxLevMin(-124);
  record.setQQualMin(-18);
  record.setQHyst(4);
  record.setSNonIntraSearchP(18);
  record.setSNonIntraSearchQ(6);
  record.setSIntraSearchP(62);
  record.setSIntraSearchQ(10);
  record.setThreshServingLowP(6);
  record.setThreshServingLowQ(0);
  for (const Layer& layer : kLayers) {
    if (layer.earfcn == cell.dlEarfcn) {
      record.setPriorityOperatingFreq(layer.priority);
      continue;
    }
    auto neighbour = std::make_shared<NbrEutra>();
    neighbour->setEarfcn(layer.earfcn);
    neighbour->setQRxlevMin(-124);
    neighbour->setQQualMin(-18);
    neighbour->setQOffset(0);
    neighbour->setPmax(23);
    neighbour->setDlBw(layer.bandwidthCode);
    neighbour->setThresXHighP(16);
    neighbour->setThresXLowP(6);
    neighbour->setThresXHighQ(0);
    neighbour->setThresXLowQ(0);
    neighbour->setPriority(layer.priority);
    neighbour->setFrameType(NbrEutra::FDD);
    neighbour->setBand(layer.band);
    record.addNbrEutra(neighbour);
  }
  return metricOf(messages::metric::KCellularLteSelReselCellInfo, record);
}

service::Metric servingCellMeasurement(const ReportContext& context) {
  KCellularLteServingCellMeasurement record;
  record.setTimestamp(context.atMs);
  record.setIsConnectedMode(context.phone.lte().connected());
  for (int antenna = 0; antenna < 2; ++antenna) {
    const LteLevel level = sample(servingLevel(context), context.fading);
    auto info = std::make_shared<RxInfo>();
    info->setRssi(wholeDb(level.rssiDbm));
    info->setRsrpRange(units::rsrpIndex(level.rsrpDbm));
    info->setRsrqRange(units::rsrqIndex(level.rsrqDb));
    info->setSnr(wholeDb(level.sinrDb));
    record.addRxInfo(info);
  }
  return metricOf(messages::metric::KCellularLteServingCellMeasurement, record);
}

service::Metric txPower(const ReportContext& context) {
  const LteCell& cell = servingCell(context);
  const double pathLossDb =
      cell.referenceSignalDbm - kNetAntennaGainDb - servingLevel(context).rsrpDbm;
  const bool heavy = context.traffic.demand() == Traffic::Demand::Heavy;
  KCellularLteTxPower record;
  record.setTimestamp(context.atMs);
  // Every other subframe of the last radio frame.
  const auto firstSubframe = static_cast<std::uint32_t>(context.fading.between(0, 1));
  for (std::uint32_t subframe = firstSubframe; subframe < 10; subframe += 2) {
    const double resourceBlocks =
        heavy ? context.fading.uniform(20.0, 50.0) : context.fading.uniform(1.0, 8.0);
    auto sample = std::make_shared<TxPowerInfo>();
    sample->setPucchTxPower(
        wholeDb(uplinkPowerDbm(-105.0, 1.0, pathLossDb, context.fading.normal(0.0, 1.0))));
    sample->setPuschTxPower(
        wholeDb(uplinkPowerDbm(-85.0, 0.8, pathLossDb, 10.0 * std::log10(resourceBlocks))));
    sample->setSubframeIndex(subframe);
    record.addTxPowerInfo(sample);
  }
  return metricOf(messages::metric::KCellularLteTxPower, record);
}

service::Metric rsrpRsrqSinr(const ReportContext& context) {
  const std::uint32_t pci = servingCell(context).pci;
  const LteLevel& level = servingLevel(context);
  KCellularLteRsrpRsrqSinr record;
  record.setTimestamp(context.atMs);
  record.setLastXSeconds(1);
  record.setLastYSamples(kInstantSamples);
  record.setSamplePeriodMs(kSamplePeriodMs);
  record.setDurationMs(kInstantSamples * kSamplePeriodMs);
  record.setNumSamples(kInstantSamples);
  std::array<LteLevel, 2> average{};
  const auto accumulate = [](LteLevel& total, const LteLevel& instant) {
    total.rsrpDbm += instant.rsrpDbm / kInstantSamples;
    total.rsrqDb += instant.rsrqDb / kInstantSamples;
    total.sinrDb += instant.sinrDb / kInstantSamples;
  };
  for (std::uint32_t i = 0; i < kInstantSamples; ++i) {
    const LteLevel antenna0 = sample(level, context.fading);
    const LteLevel antenna1 = sample(level, context.fading);
    record.addInstValues(rsrpRsrqSinrOf(pci, antenna0, antenna1));
    accumulate(average[0], antenna0);
    accumulate(average[1], antenna1);
  }
  record.setAvgValues(rsrpRsrqSinrOf(pci, average[0], average[1]));
  return metricOf(messages::metric::KCellularLteRsrpRsrqSinr, record);
}

service::Metric componentCarriers(const ReportContext& context) {
  const LteState& lte = context.phone.lte();
  KCellularLteComponentCarrierInfo record;
  record.setTimestamp(context.atMs);
  if (lte.serving) {
    record.setPccEarfcn(servingCell(context).dlEarfcn);
    record.setPccBandwidth(servingCell(context).bandwidthCode);
  }
  std::vector<const LteCell*> configured;
  for (const SecondaryCarrier& scc : lte.secondaries) {
    if (scc.state != SecondaryComponentCarrier::SCC_STATE_DECONFIGURED) {
      configured.push_back(&context.network.lte[scc.cell]);
    }
  }
  if (configured.size() > 0) {
    record.setScc0Earfcn(configured[0]->dlEarfcn);
    record.setScc0Bandwidth(configured[0]->bandwidthCode);
  }
  if (configured.size() > 1) {
    record.setScc1Earfcn(configured[1]->dlEarfcn);
    record.setScc1Bandwidth(configured[1]->bandwidthCode);
  }
  return metricOf(messages::metric::KCellularLteComponentCarrierInfo, record);
}

service::Metric carrierAggregationStatus(const ReportContext& context) {
  KCellularLteCarrierAggregationStatus record;
  record.setTimestamp(context.atMs);
  std::uint32_t index = 1;
  for (const SecondaryCarrier& scc : context.phone.lte().secondaries) {
    const LteCell& cell = context.network.lte[scc.cell];
    const LteLevel level = sample(context.radio.lte()[scc.cell], context.fading);
    auto carrier = std::make_shared<SecondaryComponentCarrier>();
    carrier->setIndex(index++);
    carrier->setState(scc.state);
    carrier->setPci(cell.pci);
    carrier->setDlEarfcn(cell.dlEarfcn);
    carrier->setDlRfBand(cell.band);
    carrier->setDlBandwidth(cell.bandwidthCode);
    carrier->setHasUplink(false);
    carrier->setRsrp(centiDb(level.rsrpDbm));
    carrier->setRsrq(centiDb(level.rsrqDb));
    carrier->setSnr(centiDb(level.sinrDb));
    carrier->setRssi(centiDb(level.rssiDbm));
    record.addSccList(carrier);
  }
  return metricOf(messages::metric::KCellularLteCarrierAggregationStatus, record);
}

service::Metric secondaryCellMeasurement(const ReportContext& context) {
  KCellularLteSecondaryCellMeasurements record;
  record.setTimestamp(context.atMs);
  std::uint32_t index = 1;
  for (const SecondaryCarrier& scc : context.phone.lte().secondaries) {
    const LteLevel level = sample(context.radio.lte()[scc.cell], context.fading);
    auto measurement = std::make_shared<SccRxMeasurement>();
    measurement->setIndex(index++);
    measurement->setRsrp(centiDb(level.rsrpDbm));
    measurement->setRsrq(centiDb(level.rsrqDb));
    measurement->setSnr(centiDb(level.sinrDb));
    measurement->setRssi(centiDb(level.rssiDbm));
    record.addSccRxMeasurement(measurement);
  }
  return metricOf(messages::metric::KCellularLteSecondaryCellMeasurements, record);
}

service::Metric neighbourMeasurement(const ReportContext& context) {
  const std::size_t serving = *context.phone.lte().serving;
  KCellularLteNbrEutraCellMeas record;
  record.setTimestamp(context.atMs);
  for (const std::size_t i :
       context.radio.rankedLte(8, [serving](std::size_t i) { return i != serving; })) {
    const LteCell& cell = context.network.lte[i];
    const LteLevel level = sample(context.radio.lte()[i], context.fading);
    auto neighbour = std::make_shared<EgwErrcNbrEutraMeas>();
    neighbour->setNbrEarfcn(cell.dlEarfcn);
    neighbour->setNbrPhysCellId(cell.pci);
    neighbour->setFreqBandInd(cell.band);
    neighbour->setNbrRsrp(static_cast<std::int32_t>(units::rsrpIndex(level.rsrpDbm)));
    neighbour->setNbrRsrq(static_cast<std::int32_t>(units::rsrqIndex(level.rsrqDb)));
    record.addMeasNbrEutra(neighbour);
  }
  return metricOf(messages::metric::KCellularLteNbrEutraCellMeas, record);
}

service::Metric interRatMeasurement(const ReportContext& context) {
  const auto any = [](std::size_t) { return true; };
  KCellularLteNbrInterRatCellMeas record;
  record.setTimestamp(context.atMs);
  for (const std::size_t i : context.radio.rankedUmts(6, any)) {
    const UmtsCell& cell = context.network.umts[i];
    const UmtsLevel& level = context.radio.umts()[i];
    auto neighbour = std::make_shared<EgwErrcNbrUtraMeas>();
    neighbour->setUarfcn(cell.dlUarfcn);
    neighbour->setPsc(cell.psc);
    neighbour->setRscp(static_cast<std::int32_t>(
        units::rscpIndex(level.rscpDbm + context.fading.normal(0.0, 1.5))));
    neighbour->setEcno(units::ecnoIndex(level.ecnoDb + context.fading.normal(0.0, 0.7)));
    record.addMeasNbrUtra(neighbour);
  }
  for (const std::size_t i : context.radio.rankedGsm(6, any)) {
    const GsmCell& cell = context.network.gsm[i];
    auto neighbour = std::make_shared<EgwErrcNbrGeranMeas>();
    neighbour->setArfcn(cell.arfcn);
    neighbour->setBsic(cell.bsic);
    neighbour->setRxlev(
        units::rxlevIndex(context.radio.gsm()[i].rxlevDbm + context.fading.normal(0.0, 1.5)));
    record.addMeasNbrGeran(neighbour);
  }
  return metricOf(messages::metric::KCellularLteNbrInterRatCellMeas, record);
}

}  // namespace tarn::sim::lte_reports
