#include "tarn/mm/Metrics.h"

#include <ModemManager.h>

#include <array>
#include <memory>
#include <utility>

#include "messages/Metrics.h"
#include "messages/Records.h"
#include "platform/Format.h"
#include "radio/GsmBands.h"
#include "radio/LteBands.h"
#include "radio/Plmn.h"
#include "radio/UmtsBands.h"
#include "tarn/mm/BasebandUnits.h"

namespace tarn::mm {
namespace {

using namespace messages;

using RegStatus = KCellularEmmContext::RegStatus;

// ModemManager's 3GPP registration states as the NAS contexts' registration status.
constexpr std::array<std::pair<std::uint32_t, RegStatus>, 11> kRegistrationStatus = {{
    {MM_MODEM_3GPP_REGISTRATION_STATE_IDLE, KCellularEmmContext::KREG_STATUS_NO_SERVICE},
    {MM_MODEM_3GPP_REGISTRATION_STATE_HOME, KCellularEmmContext::KREG_STATUS_NORMAL_SERVICE},
    {MM_MODEM_3GPP_REGISTRATION_STATE_SEARCHING,
     KCellularEmmContext::KREG_STATUS_REGISTRATION_IN_PROGRESS},
    {MM_MODEM_3GPP_REGISTRATION_STATE_DENIED,
     KCellularEmmContext::KREG_STATUS_REGISTRATION_FAILURE},
    {MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING, KCellularEmmContext::KREG_STATUS_NORMAL_SERVICE},
    {MM_MODEM_3GPP_REGISTRATION_STATE_HOME_SMS_ONLY,
     KCellularEmmContext::KREG_STATUS_REGISTERED_SMS_ONLY},
    {MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING_SMS_ONLY,
     KCellularEmmContext::KREG_STATUS_REGISTERED_SMS_ONLY},
    {MM_MODEM_3GPP_REGISTRATION_STATE_EMERGENCY_ONLY,
     KCellularEmmContext::KREG_STATUS_EMERGENCY_SERVICE},
    {MM_MODEM_3GPP_REGISTRATION_STATE_HOME_CSFB_NOT_PREFERRED,
     KCellularEmmContext::KREG_STATUS_NORMAL_SERVICE},
    {MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING_CSFB_NOT_PREFERRED,
     KCellularEmmContext::KREG_STATUS_NORMAL_SERVICE},
    {MM_MODEM_3GPP_REGISTRATION_STATE_ATTACHED_RLOS,
     KCellularEmmContext::KREG_STATUS_LIMITED_SERVICE},
}};

// Access technology bits of each radio, the newest first.
constexpr std::array<std::pair<std::uint32_t, Rat>, 3> kAccessTechnologies = {{
    {MM_MODEM_ACCESS_TECHNOLOGY_LTE | MM_MODEM_ACCESS_TECHNOLOGY_LTE_CAT_M |
         MM_MODEM_ACCESS_TECHNOLOGY_LTE_NB_IOT,
     Rat::Lte},
    {MM_MODEM_ACCESS_TECHNOLOGY_UMTS | MM_MODEM_ACCESS_TECHNOLOGY_HSDPA |
         MM_MODEM_ACCESS_TECHNOLOGY_HSUPA | MM_MODEM_ACCESS_TECHNOLOGY_HSPA |
         MM_MODEM_ACCESS_TECHNOLOGY_HSPA_PLUS,
     Rat::Umts},
    {MM_MODEM_ACCESS_TECHNOLOGY_GSM | MM_MODEM_ACCESS_TECHNOLOGY_GSM_COMPACT |
         MM_MODEM_ACCESS_TECHNOLOGY_GPRS | MM_MODEM_ACCESS_TECHNOLOGY_EDGE,
     Rat::Gsm},
}};

// Sets a field from a value that may be absent.
template <class Record, class Argument, class T>
void put(Record& record, void (Record::*setter)(Argument), const std::optional<T>& value) {
  if (value) (record.*setter)(static_cast<Argument>(*value));
}

// Encodes a measurement that may be absent as an index; one the index cannot carry is dropped.
class Encoder {
 public:
  explicit Encoder(Problems& problems) : problems_(problems) {}

  std::optional<std::uint32_t> operator()(const std::optional<double>& value,
                                          std::optional<std::uint32_t> (*index)(double),
                                          std::string_view what) const {
    if (!value) return std::nullopt;
    std::optional<std::uint32_t> encoded = index(*value);
    if (!encoded)
      problems_.push_back(
          platform::format("%s %g is outside what a baseband reports; dropped", what, *value));
    return encoded;
  }

 private:
  Problems& problems_;
};

template <class Record>
std::optional<service::Metric> ifFilled(std::uint32_t metricId, const Record& record, bool filled) {
  if (!filled) return std::nullopt;
  return service::Metric{metricId, record.data()};
}

const Cell* servingCell(const Snapshot& snapshot, Rat rat) {
  for (const Cell& cell : snapshot.cells) {
    if (cell.serving && cell.rat == rat) return &cell;
  }
  return nullptr;
}

std::vector<const Cell*> neighbours(const Snapshot& snapshot, Rat rat) {
  std::vector<const Cell*> found;
  for (const Cell& cell : snapshot.cells) {
    if (!cell.serving && cell.rat == rat) found.push_back(&cell);
  }
  return found;
}

template <class T>
std::optional<T> either(const std::optional<T>& first, const Cell* cell,
                        std::optional<T> Cell::*field) {
  if (first) return first;
  return cell != nullptr ? cell->*field : std::nullopt;
}

std::optional<RegStatus> regStatus(const std::optional<std::uint32_t>& state) {
  if (!state) return std::nullopt;
  for (const auto& [registration, status] : kRegistrationStatus) {
    if (registration == *state) return status;
  }
  return std::nullopt;
}

// The operating band of a channel number, from the 3GPP tables of src/radio.
std::optional<std::uint32_t> lteBand(const std::optional<std::uint32_t>& earfcn) {
  if (!earfcn) return std::nullopt;
  const std::optional<radio::LteChannel> channel = radio::decodeEarfcn(*earfcn);
  return channel ? std::optional(channel->band) : std::nullopt;
}

std::optional<std::uint32_t> umtsBand(const std::optional<std::uint32_t>& uarfcn) {
  if (!uarfcn) return std::nullopt;
  const std::optional<radio::UmtsChannel> channel = radio::decodeUarfcn(*uarfcn);
  return channel ? std::optional(channel->band) : std::nullopt;
}

// The UMTS bands that the records' band enumeration names, by band number.
constexpr std::array<std::pair<std::uint32_t, SysBand>, 11> kUmtsSysBands = {{
    {1, SYS_BAND_WCDMA_I_IMT_2000},
    {2, SYS_BAND_WCDMA_II_PCS_1900},
    {3, SYS_BAND_WCDMA_III_1700},
    {4, SYS_BAND_WCDMA_IV_1700},
    {5, SYS_BAND_WCDMA_V_850},
    {6, SYS_BAND_WCDMA_VI_800},
    {7, SYS_BAND_WCDMA_VII_2600},
    {8, SYS_BAND_WCDMA_VIII_900},
    {9, SYS_BAND_WCDMA_IX_1700},
    {11, SYS_BAND_WCDMA_XI_1500},
    {19, SYS_BAND_WCDMA_XIX_850},
}};

constexpr std::array<std::pair<radio::GsmBand, SysBand>, 9> kGsmSysBands = {{
    {radio::GsmBand::gsm450, SYS_BAND_GSM_450},
    {radio::GsmBand::gsm480, SYS_BAND_GSM_480},
    {radio::GsmBand::gsm750, SYS_BAND_GSM_750},
    {radio::GsmBand::gsm850, SYS_BAND_GSM_850},
    {radio::GsmBand::pgsm900, SYS_BAND_GSM_PGSM_900},
    {radio::GsmBand::egsm900, SYS_BAND_GSM_EGSM_900},
    {radio::GsmBand::rgsm900, SYS_BAND_GSM_RGSM_900},
    {radio::GsmBand::dcs1800, SYS_BAND_GSM_DCS_1800},
    {radio::GsmBand::pcs1900, SYS_BAND_GSM_PCS_1900},
}};

template <class Key, std::size_t N>
std::optional<SysBand> sysBand(const std::array<std::pair<Key, SysBand>, N>& table,
                               const std::optional<Key>& key) {
  if (!key) return std::nullopt;
  for (const auto& [band, sys] : table) {
    if (band == *key) return sys;
  }
  return std::nullopt;
}

std::optional<radio::GsmBand> gsmBand(const std::optional<std::uint32_t>& arfcn) {
  if (!arfcn) return std::nullopt;
  // Without the cell's band indicator, ARFCNs 512 to 810 stay without a band.
  const std::optional<radio::GsmChannel> channel = radio::decodeArfcn(*arfcn);
  return channel ? std::optional(channel->band) : std::nullopt;
}

// The PLMN as the three bytes that NAS identities carry.
std::optional<platform::Bytes> encodedPlmn(const std::optional<Plmn>& plmn) {
  if (!plmn) return std::nullopt;
  const std::optional<radio::Plmn> parsed = radio::plmnFromOperatorCode(plmn->digits);
  if (!parsed) return std::nullopt;
  const std::optional<radio::PlmnBytes> bytes = radio::encodePlmn(*parsed);
  if (!bytes) return std::nullopt;
  return platform::Bytes(bytes->begin(), bytes->end());
}

// ---- LTE

std::optional<service::Metric> lteServingCellInfo(const Cell& cell, std::uint64_t atMs) {
  KCellularLteScellInfo record;
  record.setTimestamp(atMs);
  put(record, &KCellularLteScellInfo::setPhyCellId, cell.pci);
  put(record, &KCellularLteScellInfo::setDlFreq, cell.channel);
  put(record, &KCellularLteScellInfo::setCellId, cell.cellId);
  put(record, &KCellularLteScellInfo::setTrackingAreaCode, cell.tac);
  put(record, &KCellularLteScellInfo::setFreqBandInd, lteBand(cell.channel));
  if (cell.plmn) {
    record.setSelPlmnMcc(cell.plmn->mcc);
    record.setSelPlmnMnc(cell.plmn->mnc);
    record.setNumMncDigits(cell.plmn->mncDigits);
  }
  return ifFilled(messages::metric::KCellularLteScellInfo, record,
                  cell.pci || cell.channel || cell.cellId || cell.tac || cell.plmn);
}

std::optional<service::Metric> lteServingMeasurement(const LteSignal& signal, const Cell* cell,
                                                     std::uint64_t atMs, const Encoder& encode) {
  const std::optional<double> rsrp = either(signal.rsrp, cell, &Cell::rsrp);
  const std::optional<double> rsrq = either(signal.rsrq, cell, &Cell::rsrq);
  auto info = std::make_shared<RxInfo>();
  put(*info, &RxInfo::setRssi,
      signal.rssi ? std::optional(units::wholeDb(*signal.rssi)) : std::nullopt);
  put(*info, &RxInfo::setRsrpRange, encode(rsrp, &units::rsrpIndex, "RSRP"));
  put(*info, &RxInfo::setRsrqRange, encode(rsrq, &units::rsrqIndex, "RSRQ"));
  put(*info, &RxInfo::setSnr,
      signal.snr ? std::optional(units::wholeDb(*signal.snr)) : std::nullopt);
  KCellularLteServingCellMeasurement record;
  record.setTimestamp(atMs);
  const bool filled =
      info->hasRssi() || info->hasRsrpRange() || info->hasRsrqRange() || info->hasSnr();
  record.addRxInfo(std::move(info));
  return ifFilled(messages::metric::KCellularLteServingCellMeasurement, record, filled);
}

std::optional<service::Metric> lteRsrpRsrqSinr(const LteSignal& signal, const Cell* cell,
                                               std::uint64_t atMs) {
  const std::optional<double> rsrp = either(signal.rsrp, cell, &Cell::rsrp);
  const std::optional<double> rsrq = either(signal.rsrq, cell, &Cell::rsrq);
  if (!rsrp && !rsrq && !signal.snr) return std::nullopt;
  // One instantaneous sample of the first receive path; the second is not reported.
  auto sample = std::make_shared<RsrpRsrqSinr>();
  if (cell != nullptr) put(*sample, &RsrpRsrqSinr::setPhyCellId, cell->pci);
  if (rsrp) sample->setRsrp0(units::wholeDb(*rsrp));
  if (rsrq) sample->setRsrq0(units::wholeDb(*rsrq));
  if (signal.snr) sample->setSinr0(units::halfDb(*signal.snr));
  KCellularLteRsrpRsrqSinr record;
  record.setTimestamp(atMs);
  record.addInstValues(std::move(sample));
  return service::Metric{messages::metric::KCellularLteRsrpRsrqSinr, record.data()};
}

std::optional<service::Metric> lteNeighbours(const Snapshot& snapshot, std::uint64_t atMs,
                                             const Encoder& encode) {
  KCellularLteNbrEutraCellMeas record;
  record.setTimestamp(atMs);
  for (const Cell* cell : neighbours(snapshot, Rat::Lte)) {
    auto neighbour = std::make_shared<EgwErrcNbrEutraMeas>();
    put(*neighbour, &EgwErrcNbrEutraMeas::setNbrEarfcn, cell->channel);
    put(*neighbour, &EgwErrcNbrEutraMeas::setNbrPhysCellId, cell->pci);
    put(*neighbour, &EgwErrcNbrEutraMeas::setFreqBandInd, lteBand(cell->channel));
    put(*neighbour, &EgwErrcNbrEutraMeas::setNbrRsrp,
        encode(cell->rsrp, &units::rsrpIndex, "neighbour RSRP"));
    put(*neighbour, &EgwErrcNbrEutraMeas::setNbrRsrq,
        encode(cell->rsrq, &units::rsrqIndex, "neighbour RSRQ"));
    record.addMeasNbrEutra(std::move(neighbour));
  }
  return ifFilled(messages::metric::KCellularLteNbrEutraCellMeas, record,
                  record.measNbrEutrasCount() > 0);
}

std::optional<service::Metric> lteInterRatNeighbours(const Snapshot& snapshot, std::uint64_t atMs,
                                                     const Encoder& encode) {
  KCellularLteNbrInterRatCellMeas record;
  record.setTimestamp(atMs);
  for (const Cell* cell : neighbours(snapshot, Rat::Umts)) {
    auto neighbour = std::make_shared<EgwErrcNbrUtraMeas>();
    put(*neighbour, &EgwErrcNbrUtraMeas::setUarfcn, cell->channel);
    put(*neighbour, &EgwErrcNbrUtraMeas::setPsc, cell->psc);
    put(*neighbour, &EgwErrcNbrUtraMeas::setRscp,
        encode(cell->rscp, &units::rscpIndex, "neighbour RSCP"));
    put(*neighbour, &EgwErrcNbrUtraMeas::setEcno,
        encode(cell->ecio, &units::ecnoIndex, "neighbour Ec/Io"));
    record.addMeasNbrUtra(std::move(neighbour));
  }
  for (const Cell* cell : neighbours(snapshot, Rat::Gsm)) {
    auto neighbour = std::make_shared<EgwErrcNbrGeranMeas>();
    put(*neighbour, &EgwErrcNbrGeranMeas::setArfcn, cell->channel);
    put(*neighbour, &EgwErrcNbrGeranMeas::setBsic, cell->bsic);
    put(*neighbour, &EgwErrcNbrGeranMeas::setRxlev, cell->rxLevel);
    record.addMeasNbrGeran(std::move(neighbour));
  }
  return ifFilled(messages::metric::KCellularLteNbrInterRatCellMeas, record,
                  record.measNbrUtrasCount() + record.measNbrGeransCount() > 0);
}

std::optional<service::Metric> emmContext(const Registration& registration, const Cell* cell,
                                          std::uint64_t atMs) {
  const std::optional<RegStatus> status = regStatus(registration.state);
  KCellularEmmContext record;
  record.setTimestamp(atMs);
  put(record, &KCellularEmmContext::setRegStatus, status);
  // The tracking area of the serving cell.
  if (cell != nullptr && cell->tac) {
    auto tai = std::make_shared<KCellularTrackingAreaId>();
    tai->setEncodedPlmn(encodedPlmn(cell->plmn));
    tai->setTac(*cell->tac);
    record.addTaiList(std::move(tai));
  }
  // ModemManager counts the EPS modes of operation from 1, the record from 0.
  if (registration.epsUeMode) {
    record.setUeOpMode(static_cast<KCellularEmmContext::UeOpMode>(*registration.epsUeMode - 1));
  }
  return ifFilled(messages::metric::KCellularEmmContext, record,
                  status || registration.epsUeMode || record.taiListsCount() > 0);
}

// ---- UMTS

std::optional<service::Metric> umtsServingCellInfo(const Cell& cell, std::uint64_t atMs) {
  KCellularWcdmaCellInfo record;
  record.setTimestamp(atMs);
  if (cell.plmn) {
    record.setMcc(cell.plmn->mcc);
    record.setMnc(cell.plmn->mnc);
    record.setNumMncDigits(cell.plmn->mncDigits);
  }
  put(record, &KCellularWcdmaCellInfo::setLac, cell.lac);
  put(record, &KCellularWcdmaCellInfo::setCellId, cell.cellId);
  put(record, &KCellularWcdmaCellInfo::setDlUarfcn, cell.channel);
  put(record, &KCellularWcdmaCellInfo::setWcdmaBand,
      sysBand(kUmtsSysBands, umtsBand(cell.channel)));
  put(record, &KCellularWcdmaCellInfo::setPsc, cell.psc);
  return ifFilled(messages::metric::KCellularWcdmaCellInfo, record,
                  cell.plmn || cell.lac || cell.cellId || cell.channel || cell.psc);
}

std::optional<service::Metric> umtsServingMeasurement(const UmtsSignal& signal, const Cell* cell,
                                                      std::uint64_t atMs, const Encoder& encode) {
  const std::optional<double> rscp = either(signal.rscp, cell, &Cell::rscp);
  const std::optional<double> ecio = either(signal.ecio, cell, &Cell::ecio);
  // A WCDMA receive measurement carries RSCP in the RSRP slot and Ec/No in the RSRQ slot.
  auto info = std::make_shared<RxInfo>();
  put(*info, &RxInfo::setRssi,
      signal.rssi ? std::optional(units::wholeDb(*signal.rssi)) : std::nullopt);
  put(*info, &RxInfo::setRsrpRange, encode(rscp, &units::rscpIndex, "RSCP"));
  put(*info, &RxInfo::setRsrqRange, encode(ecio, &units::ecnoIndex, "Ec/Io"));
  const bool filled = info->hasRssi() || info->hasRsrpRange() || info->hasRsrqRange();
  KCellularWcdmaScellMeasurement record;
  record.setTimestamp(atMs);
  record.addRxInfo(std::move(info));
  return ifFilled(messages::metric::KCellularWcdmaScellMeasurement, record, filled);
}

std::optional<service::Metric> umtsNeighbours(const Snapshot& snapshot, std::uint64_t atMs,
                                              const Encoder& encode) {
  KCellularWcdmaNbrCellMeas record;
  record.setTimestamp(atMs);
  for (const Cell* cell : neighbours(snapshot, Rat::Umts)) {
    auto result = std::make_shared<UtraCellMeasResult>();
    put(*result, &UtraCellMeasResult::setUarfcn, cell->channel);
    put(*result, &UtraCellMeasResult::setBand, umtsBand(cell->channel));
    put(*result, &UtraCellMeasResult::setPsc, cell->psc);
    put(*result, &UtraCellMeasResult::setRscp,
        encode(cell->rscp, &units::rscpIndex, "neighbour RSCP"));
    put(*result, &UtraCellMeasResult::setEcno,
        encode(cell->ecio, &units::ecnoIndex, "neighbour Ec/Io"));
    record.addMeasUtraResult(std::move(result));
  }
  for (const Cell* cell : neighbours(snapshot, Rat::Gsm)) {
    auto result = std::make_shared<GsmCellMeasResult>();
    put(*result, &GsmCellMeasResult::setArfcn, cell->channel);
    put(*result, &GsmCellMeasResult::setBsic, cell->bsic);
    put(*result, &GsmCellMeasResult::setRxlev, cell->rxLevel);
    record.addMeasGsmResult(std::move(result));
  }
  for (const Cell* cell : neighbours(snapshot, Rat::Lte)) {
    auto result = std::make_shared<LteCellMeasResult>();
    put(*result, &LteCellMeasResult::setEarfcn, cell->channel);
    put(*result, &LteCellMeasResult::setPhyCellId, cell->pci);
    put(*result, &LteCellMeasResult::setEutraBand, lteBand(cell->channel));
    put(*result, &LteCellMeasResult::setRsrp,
        encode(cell->rsrp, &units::rsrpIndex, "neighbour RSRP"));
    put(*result, &LteCellMeasResult::setRsrq,
        encode(cell->rsrq, &units::rsrqIndex, "neighbour RSRQ"));
    record.addMeasLteResult(std::move(result));
  }
  return ifFilled(
      messages::metric::KCellularWcdmaNbrCellMeas, record,
      record.measUtraResultsCount() + record.measGsmResultsCount() + record.measLteResultsCount() >
          0);
}

// ---- GSM

std::optional<service::Metric> gsmServingCellInfo(const Cell& cell, std::uint64_t atMs) {
  KCellularGsmScellInfo record;
  record.setTimestamp(atMs);
  if (cell.plmn) {
    record.setMcc(cell.plmn->mcc);
    record.setMnc(cell.plmn->mnc);
    record.setNumMncDigits(cell.plmn->mncDigits);
  }
  put(record, &KCellularGsmScellInfo::setLac, cell.lac);
  put(record, &KCellularGsmScellInfo::setCellId, cell.cellId);
  put(record, &KCellularGsmScellInfo::setArfcn, cell.channel);
  put(record, &KCellularGsmScellInfo::setBsic, cell.bsic);
  put(record, &KCellularGsmScellInfo::setGsmBand, sysBand(kGsmSysBands, gsmBand(cell.channel)));
  return ifFilled(messages::metric::KCellularGsmScellInfo, record,
                  cell.plmn || cell.lac || cell.cellId || cell.channel || cell.bsic);
}

std::optional<service::Metric> gsmServingMeasurement(const GsmSignal& signal, const Cell* cell,
                                                     std::uint64_t atMs) {
  // The received level in dBm: the Signal interface's, or the cell's RXLEV index.
  std::optional<std::int32_t> rxlevDbm;
  if (signal.rssi) {
    rxlevDbm = units::wholeDb(*signal.rssi);
  } else if (cell != nullptr && cell->rxLevel) {
    rxlevDbm = static_cast<std::int32_t>(*cell->rxLevel) - 110;
  }
  KCellularGsmIdleScellMeasurement record;
  record.setTimestamp(atMs);
  if (cell != nullptr) put(record, &KCellularGsmIdleScellMeasurement::setScellArfcn, cell->channel);
  put(record, &KCellularGsmIdleScellMeasurement::setIdleRxlevDBm, rxlevDbm);
  return ifFilled(messages::metric::KCellularGsmIdleScellMeasurement, record, rxlevDbm.has_value());
}

std::optional<service::Metric> gsmNeighbours(const Snapshot& snapshot, std::uint64_t atMs,
                                             const Encoder& encode) {
  KCellularGsmGrrEventMeasCr record;
  record.setTimestamp(atMs);
  for (const Cell* cell : neighbours(snapshot, Rat::Gsm)) {
    auto neighbour = std::make_shared<GsmNcellMeas>();
    if (cell->plmn) {
      neighbour->setMcc(cell->plmn->mcc);
      neighbour->setMnc(cell->plmn->mnc);
    }
    put(*neighbour, &GsmNcellMeas::setLac, cell->lac);
    put(*neighbour, &GsmNcellMeas::setCi, cell->cellId);
    put(*neighbour, &GsmNcellMeas::setBsic, cell->bsic);
    put(*neighbour, &GsmNcellMeas::setArfcn, cell->channel);
    put(*neighbour, &GsmNcellMeas::setRxlev, cell->rxLevel);
    record.addGsmNcellMeas(std::move(neighbour));
  }
  for (const Cell* cell : neighbours(snapshot, Rat::Umts)) {
    auto neighbour = std::make_shared<UmtsNcellMeas>();
    put(*neighbour, &UmtsNcellMeas::setCpichSc, cell->psc);
    put(*neighbour, &UmtsNcellMeas::setDlUarfcn, cell->channel);
    put(*neighbour, &UmtsNcellMeas::setCpichRscp,
        encode(cell->rscp, &units::rscpIndex, "neighbour RSCP"));
    put(*neighbour, &UmtsNcellMeas::setCpichEcn0,
        encode(cell->ecio, &units::ecnoIndex, "neighbour Ec/Io"));
    record.addUmtsNcellMeas(std::move(neighbour));
  }
  for (const Cell* cell : neighbours(snapshot, Rat::Lte)) {
    auto neighbour = std::make_shared<LteNcellMeas>();
    put(*neighbour, &LteNcellMeas::setPhysicalCellId, cell->pci);
    put(*neighbour, &LteNcellMeas::setEarfcn, cell->channel);
    put(*neighbour, &LteNcellMeas::setRsrp,
        encode(cell->rsrp, &units::rsrpIndex, "neighbour RSRP"));
    put(*neighbour, &LteNcellMeas::setRsrq,
        encode(cell->rsrq, &units::rsrqIndex, "neighbour RSRQ"));
    record.addLteNcellMeas(std::move(neighbour));
  }
  return ifFilled(
      messages::metric::KCellularGsmGrrEventMeasCr, record,
      record.gsmNcellMeasCount() + record.umtsNcellMeasCount() + record.lteNcellMeasCount() > 0);
}

// ---- circuit- and packet-switched mobility management, on GSM and UMTS

std::optional<service::Metric> mmContext(const Registration& registration, const Cell* cell,
                                         std::uint64_t atMs) {
  const std::optional<RegStatus> status = regStatus(registration.state);
  KCellularMmContext record;
  record.setTimestamp(atMs);
  put(record, &KCellularMmContext::setRegStatus, status);
  if (cell != nullptr && cell->lac) {
    auto lai = std::make_shared<KCellularLocationAreaId>();
    lai->setEncodedPlmn(encodedPlmn(cell->plmn));
    lai->setLac(*cell->lac);
    record.setLai(std::move(lai));
  }
  return ifFilled(messages::metric::KCellularMmContext, record, status || record.hasLai());
}

std::optional<service::Metric> gmmContext(const Registration& registration, const Cell* cell,
                                          std::uint64_t atMs) {
  std::optional<RegStatus> status = regStatus(registration.state);
  if (registration.packetService == MM_MODEM_3GPP_PACKET_SERVICE_STATE_DETACHED)
    status = KCellularEmmContext::KREG_STATUS_SERVICE_DETACHED;
  KCellularGmmContext record;
  record.setTimestamp(atMs);
  put(record, &KCellularGmmContext::setRegStatus, status);
  if (cell != nullptr && cell->lac) {
    auto rai = std::make_shared<RoutingAreaId>();
    rai->setEncodedPlmn(encodedPlmn(cell->plmn));
    rai->setLac(*cell->lac);
    record.setRai(std::move(rai));
  }
  return ifFilled(messages::metric::KCellularGmmContext, record, status || record.hasRai());
}

}  // namespace

std::optional<Rat> currentRat(const Snapshot& snapshot) {
  for (const Cell& cell : snapshot.cells) {
    if (cell.serving) return cell.rat;
  }
  if (!snapshot.registration.accessTechnologies) return std::nullopt;
  for (const auto& [bits, rat] : kAccessTechnologies) {
    if ((*snapshot.registration.accessTechnologies & bits) != 0) return rat;
  }
  return std::nullopt;
}

std::vector<service::Metric> radioMetrics(const Snapshot& snapshot, std::uint64_t atMs,
                                          Problems& problems) {
  const std::optional<Rat> rat = currentRat(snapshot);
  if (!rat) return {};
  const Encoder encode(problems);
  // The serving cell as GetCellInfo gives it, its PLMN else the one the modem registered on.
  std::optional<Cell> known;
  if (const Cell* cell = servingCell(snapshot, *rat)) known = *cell;
  if (snapshot.registration.operatorPlmn && !(known && known->plmn)) {
    if (!known) {
      known.emplace();
      known->rat = *rat;
      known->serving = true;
    }
    known->plmn = snapshot.registration.operatorPlmn;
  }
  const Cell* serving = known ? &*known : nullptr;
  std::vector<std::optional<service::Metric>> metrics;
  switch (*rat) {
    case Rat::Lte:
      metrics = {serving ? lteServingCellInfo(*serving, atMs) : std::nullopt,
                 lteServingMeasurement(snapshot.lte, serving, atMs, encode),
                 lteRsrpRsrqSinr(snapshot.lte, serving, atMs),
                 lteNeighbours(snapshot, atMs, encode),
                 lteInterRatNeighbours(snapshot, atMs, encode),
                 emmContext(snapshot.registration, serving, atMs)};
      break;
    case Rat::Umts:
      metrics = {serving ? umtsServingCellInfo(*serving, atMs) : std::nullopt,
                 umtsServingMeasurement(snapshot.umts, serving, atMs, encode),
                 umtsNeighbours(snapshot, atMs, encode),
                 mmContext(snapshot.registration, serving, atMs),
                 gmmContext(snapshot.registration, serving, atMs)};
      break;
    case Rat::Gsm:
      metrics = {serving ? gsmServingCellInfo(*serving, atMs) : std::nullopt,
                 gsmServingMeasurement(snapshot.gsm, serving, atMs),
                 gsmNeighbours(snapshot, atMs, encode),
                 mmContext(snapshot.registration, serving, atMs),
                 gmmContext(snapshot.registration, serving, atMs)};
      break;
  }
  std::vector<service::Metric> made;
  for (std::optional<service::Metric>& metric : metrics) {
    if (metric) made.push_back(std::move(*metric));
  }
  return made;
}

service::Metric bearerMetric(const std::vector<Bearer>& connected, std::uint64_t atMs) {
  // ModemManager's IP families as the PDP types of a bearer context.
  constexpr std::array<std::pair<std::uint32_t, BearerContext::PdpType>, 3> kPdpTypes = {{
      {MM_BEARER_IP_FAMILY_IPV4, BearerContext::PDP_TYPE_IPv4},
      {MM_BEARER_IP_FAMILY_IPV6, BearerContext::PDP_TYPE_IPv6},
      {MM_BEARER_IP_FAMILY_IPV4V6, BearerContext::PDP_TYPE_IPv4v6},
  }};
  const auto addressType = [](const platform::Bytes& address) {
    return address.size() == 4 ? BearerContext::PDP_TYPE_IPv4 : BearerContext::PDP_TYPE_IPv6;
  };
  KCellularActivatedBearerContexts record;
  record.setTimestamp(atMs);
  record.setBearerContextCount(static_cast<std::uint32_t>(connected.size()));
  for (const Bearer& bearer : connected) {
    auto context = std::make_shared<BearerContext>();
    if (bearer.profileId) context->setCid(static_cast<std::uint32_t>(*bearer.profileId));
    context->setApn(bearer.apn);
    for (const auto& [family, pdpType] : kPdpTypes) {
      if (bearer.ipFamily == family) context->setPdpType(pdpType);
    }
    context->setPdpAddr(bearer.ip4 ? bearer.ip4 : bearer.ip6);
    if (!bearer.dns.empty()) {
      context->setPrimaryDnsType(addressType(bearer.dns[0]));
      context->setPrimaryDnsAddr(bearer.dns[0]);
    }
    if (bearer.dns.size() > 1) {
      context->setSecondaryDnsType(addressType(bearer.dns[1]));
      context->setSecondaryDnsAddr(bearer.dns[1]);
    }
    record.addBearerContexts(std::move(context));
  }
  return {messages::metric::KCellularActivatedBearerContexts, record.data()};
}

}  // namespace tarn::mm
