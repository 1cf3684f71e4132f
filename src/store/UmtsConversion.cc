#include "messages/Records.h"
#include "store/Conversions.h"

// The seven UMTS (WCDMA) handlers. Neighbour levels arrive as measurement indexes; each list
// element also gets the time of its metric.
namespace store {

namespace {

using namespace messages;
using R = EntryRule;

constexpr std::string_view kMeasurementParentKeys[] = {"timestamp", "connected_mode"};
constexpr HandlerStep kServingCellMeasSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"rx_info", &storeField<&DisplayStore::myUMTS, &UMTS::rXInfo>, &displayDictionary,
             kMeasurementParentKeys},
};

constexpr HandlerStep kTxPowerSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"tx_power_info", &storeField<&DisplayStore::myUMTS, &UMTS::TxPower>,
             &displayDictionary, kTimestampKey},
};

constexpr HandlerStep kReselectionSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    ReplaceWithTextForm{"multi_band_info", ValueShape::IntegerList, true},
    RefreshKeys{&storeField<&DisplayStore::myUMTS, &UMTS::SelReselCellInfo>},
    CopyList{"eutra_prio_info", &storeField<&DisplayStore::myUMTS, &UMTS::eUtraNbrs>,
             &reselectionInfoOf<&DisplayStore::myUMTS>, kTimestampKey},
    CopyList{"utra_prio_info", &storeField<&DisplayStore::myUMTS, &UMTS::utraNbrs>,
             &reselectionInfoOf<&DisplayStore::myUMTS>, kTimestampKey},
    CopyList{"gsm_prio_info", &storeField<&DisplayStore::myUMTS, &UMTS::geraNbrs>,
             &reselectionInfoOf<&DisplayStore::myUMTS>, kTimestampKey},
};

constexpr EntryConversion kUtraLevels[] = {{"rscp", R::RscpIndex}, {"ecno", R::EcNoIndex}};
constexpr EntryConversion kGsmLevels[] = {{"rxlev", R::RxLevIndex}};
constexpr EntryConversion kLteLevels[] = {{"rsrp", R::RsrpIndex}, {"rsrq", R::RsrqIndex}};
constexpr HandlerStep kNeighbourSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"meas_utra_result", &storeField<&DisplayStore::myUMTS, &UMTS::utraNbrMeas>,
             &displayDictionary, kTimestampKey, kUtraLevels},
    CopyList{"meas_gsm_result", &storeField<&DisplayStore::myUMTS, &UMTS::geraNbrMeas>,
             &displayDictionary, kTimestampKey, kGsmLevels},
    CopyList{"meas_lte_result", &storeField<&DisplayStore::myUMTS, &UMTS::eUtraNbrMeas>,
             &displayDictionary, kTimestampKey, kLteLevels},
};

using D = DisplayDictionary;

constexpr Handler kUmtsHandlers[] = {
    recordHandler<KCellularWcdmaRrcConnectionState>(
        D::UMTSRRCState, "Received UMTS RRC Connection State is ", kTimestampThenLog),
    recordHandler<KCellularWcdmaRrcConfiguration>(
        D::UMTSRRCConfig, "Received UMTS RRC Configuration is ", kTimestampThenLog),
    recordHandler<KCellularWcdmaCellInfo>(D::UMTSCellInfo, "Received UMTS Serving Cell Info is ",
                                          kTimestampThenLog),
    recordHandler<KCellularWcdmaScellMeasurement>(
        D::UMTSCellMeas, "Received UMTS Serving Cell Meas is ", kServingCellMeasSteps),
    recordHandler<KCellularWcdmaTxPower>(D::UMTSTxPower, "Received Tx Power is ", kTxPowerSteps),
    recordHandler<KCellularWcdmaSelReselCellInfo>(
        D::UMTSSelResel, "Received UMTS Cell Resel Info is ", kReselectionSteps),
    recordHandler<KCellularWcdmaNbrCellMeas>(D::UMTSNbrMeas, "Received UMTS InterRat Meas Info is ",
                                             kNeighbourSteps),
};

}  // namespace

std::span<const Handler> umtsHandlers() {
  return kUmtsHandlers;
}

}  // namespace store
