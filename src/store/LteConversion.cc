#include "messages/Records.h"
#include "store/Conversions.h"

// The eleven LTE handlers. Carrier levels arrive in hundredths of a dB, neighbour levels as
// measurement indexes, SINR in half dB and bandwidths as codes; each list element also gets the
// time of its metric.
namespace store {

namespace {

using namespace messages;
using R = EntryRule;

constexpr HandlerStep kServingCellSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    ConvertDisplayEntry{{"dl_bw", R::HalvedBandwidth}},
    ConvertDisplayEntry{{"ul_bw", R::HalvedBandwidth}},
    LogDisplayDictionary{},
};

// The display dictionary keeps its numeric timestamp; the reselection copy gets the text.
constexpr EntryConversion kReselectionTimestamp[] = {kTimestampText};
constexpr EntryConversion kNeighbourBandwidth[] = {{"dl_bw", R::BandwidthCode}};
constexpr HandlerStep kReselectionSteps[] = {
    LogDisplayDictionary{},
    ReplaceWithTextForm{"multi_band_info", ValueShape::IntegerList, true},
    RefreshKeys{&storeField<&DisplayStore::myLTE, &LTE::SelReselCellInfo>, kReselectionTimestamp},
    CopyList{"nbr_eutra", &storeField<&DisplayStore::myLTE, &LTE::EutraNbrs>,
             &reselectionInfoOf<&DisplayStore::myLTE>, kTimestampKey, kNeighbourBandwidth},
};

// The display dictionary keeps its numeric timestamp; the elements get the text.
constexpr EntryConversion kSinr[] = {
    {"sinr0", R::SinrHalfDb}, {"sinr1", R::SinrHalfDb}, kTimestampText};
constexpr HandlerStep kRsrpRsrqSinrSteps[] = {
    LogDisplayDictionary{},
    CopyList{"inst_values", &storeField<&DisplayStore::myLTE, &LTE::RsrpRsrqSinr>,
             &displayDictionary, kTimestampKey, kSinr},
};

constexpr HandlerStep kTxPowerSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"tx_power_info", &storeField<&DisplayStore::myLTE, &LTE::TxPower>, &displayDictionary,
             kTimestampKey},
};

constexpr EntryConversion kCarrierLevels[] = {{"rsrp", R::CentiDbInteger},
                                              {"rsrq", R::CentiDbFloat},
                                              {"rssi", R::CentiDbInteger},
                                              {"dl_bandwidth", R::BandwidthCode}};
constexpr HandlerStep kCarrierAggregationSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"scc_list", &storeField<&DisplayStore::myLTE, &LTE::CAStatusList>, &displayDictionary,
             kTimestampKey, kCarrierLevels},
};

constexpr EntryConversion kSecondaryCellLevels[] = {
    {"rsrp", R::CentiDbInteger}, {"rsrq", R::CentiDbFloat}, {"rssi", R::CentiDbInteger}};
constexpr HandlerStep kSecondaryCellSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"scc_rx_measurement", &storeField<&DisplayStore::myLTE, &LTE::SecondaryCellMeasList>,
             &displayDictionary, kTimestampKey, kSecondaryCellLevels},
};

constexpr EntryConversion kEutraNeighbourLevels[] = {{"nbr_rsrp", R::RsrpIndex},
                                                     {"nbr_rsrq", R::RsrqIndex}};
constexpr HandlerStep kIntraRatSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"meas_nbr_eutra", &storeField<&DisplayStore::myLTE, &LTE::EutraNbrsMeas>,
             &displayDictionary, kTimestampKey, kEutraNeighbourLevels},
};

constexpr EntryConversion kUtraNeighbourLevels[] = {{"rscp", R::RscpIndex}, {"ecno", R::EcNoIndex}};
constexpr EntryConversion kGeranNeighbourLevels[] = {{"rxlev", R::RxLevIndex}};
constexpr HandlerStep kInterRatSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"meas_nbr_utra", &storeField<&DisplayStore::myLTE, &LTE::UtraNbrsMeas>,
             &displayDictionary, kTimestampKey, kUtraNeighbourLevels},
    CopyList{"meas_nbr_geran", &storeField<&DisplayStore::myLTE, &LTE::GeraNbrsMeas>,
             &displayDictionary, kTimestampKey, kGeranNeighbourLevels},
};

using D = DisplayDictionary;

constexpr Handler kLteHandlers[] = {
    recordHandler<KCellularLteRrcState>(D::LTERRCState, "Current RRC state is ", kTimestampThenLog),
    recordHandler<KCellularLteCdrxConfig>(D::LTECDRXConfig, "Current CDRX Config is ",
                                          kTimestampThenLog),
    recordHandler<KCellularLteScellInfo>(D::LTESCellInfo, "Current Serving Cell Info is ",
                                         kServingCellSteps),
    recordHandler<KCellularLteSelReselCellInfo>(D::LTESelResel, "Received LTE Cell Resel Info is ",
                                                kReselectionSteps),
    recordHandler<KCellularLteRsrpRsrqSinr>(D::LTERsrpRsrqSinr,
                                            "Received RSRP RSRQ SINR is : ", kRsrpRsrqSinrSteps),
    recordHandler<KCellularLteTxPower>(D::LTETxPower, "Received LTE Tx Power is ", kTxPowerSteps),
    recordHandler<KCellularLteComponentCarrierInfo>(
        D::LTECompCarr, "Received Component Carrier info is ", kTimestampThenLog),
    recordHandler<KCellularLteCarrierAggregationStatus>(
        D::LTECAStatus, "Received CA Status Dict is ", kCarrierAggregationSteps),
    recordHandler<KCellularLteSecondaryCellMeasurements>(
        D::LTESecondaryCellMeas, "Received Secondary Cell Measurement Dict is ",
        kSecondaryCellSteps),
    recordHandler<KCellularLteNbrEutraCellMeas>(D::LTEIntraRatMeas, "Received LTE IRAT Meas is ",
                                                kIntraRatSteps),
    recordHandler<KCellularLteNbrInterRatCellMeas>(
        D::LTEInterRatMeas, "Received LTE InterRat Meas Info is ", kInterRatSteps),
};

}  // namespace

std::span<const Handler> lteHandlers() {
  return kLteHandlers;
}

}  // namespace store
