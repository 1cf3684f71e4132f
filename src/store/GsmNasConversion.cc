#include "messages/Records.h"
#include "store/Conversions.h"

// The six GSM handlers, the five NAS handlers (mobility management contexts, common information
// and active bearers) and the SIM file handler.
namespace store {

namespace {

using namespace messages;
using R = EntryRule;

constexpr EntryConversion kGsmLevels[] = {{"rxlev", R::RxLevIndex}};
constexpr EntryConversion kUmtsLevels[] = {{"cpich_rscp", R::RscpIndex},
                                           {"cpich_ecn0", R::EcNoIndex}};
constexpr EntryConversion kLteLevels[] = {{"rsrp", R::RsrpIndex}, {"rsrq", R::RsrqIndex}};
constexpr HandlerStep kNeighbourSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"gsm_ncell_meas", &storeField<&DisplayStore::myGSM, &GSM::geraNbrMeas>,
             &displayDictionary, kTimestampKey, kGsmLevels},
    CopyList{"umts_ncell_meas", &storeField<&DisplayStore::myGSM, &GSM::utraNbrMeas>,
             &displayDictionary, kTimestampKey, kUmtsLevels},
    CopyList{"lte_ncell_meas", &storeField<&DisplayStore::myGSM, &GSM::eUtraNbrMeas>,
             &displayDictionary, kTimestampKey, kLteLevels},
};

// The identity and the tracking areas show as one text each.
constexpr HandlerStep kEmmContextSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    ReplaceWithTextForm{"guti", ValueShape::Dictionary},
    ReplaceWithTextForm{"tai_list", ValueShape::DictionaryList},
    LogDisplayDictionary{},
};

// Logged before its timestamp becomes text.
constexpr HandlerStep kActiveBearerSteps[] = {
    LogDisplayDictionary{},
    ConvertDisplayEntry{kTimestampText},
    CopyList{"bearer_contexts", &storeField<&DisplayStore::myCommon, &Common::activeBearer>,
             &displayDictionary, kTimestampKey},
};

constexpr HandlerStep kSimFileSteps[] = {
    ConvertDisplayEntry{kTimestampText},
    LogDisplayDictionary{},
    CopyList{"ef_list", &storeField<&DisplayStore::myCommon, &Common::simContents>,
             &displayDictionary},
};

using D = DisplayDictionary;

constexpr Handler kGsmNasHandlers[] = {
    recordHandler<KCellularGsmScellInfo>(D::GSMScellInfo, "Received GSM Serving Cell Info ",
                                         kTimestampThenLog),
    recordHandler<KCellularGsmIdleConfig>(D::GSMIdleConfigInfo, "Received GSM Idle Config Info is ",
                                          kTimestampThenLog),
    recordHandler<KCellularGsmIdleScellMeasurement>(
        D::GSMIdleScellMeas, "Received GSM Idle Serving Cell Meas Info is ", kTimestampThenLog),
    recordHandler<KCellularGsmCsRfMeasurement>(
        D::GSMConnRfMeas, "Received GSM Connected Serving Cell Meas Info is ", kTimestampThenLog),
    recordHandler<KCellularGsmGrrEventMeasCr>(D::GSMNbrMeas, "Received GSM Nbr Cell Meas Info is ",
                                              kNeighbourSteps),
    recordHandler<KCellularGsmGprsConfig>(D::GSMGPRSConfig, "Received GSM GPRS Config Info is ",
                                          kTimestampThenLog),
    recordHandler<KCellularMmCommonInfo>(D::CellularMMCommonInfo,
                                         "Received MM Common Info Dict is : ", kTimestampThenLog),
    recordHandler<KCellularMmContext>(D::MMContext, "Received MM Context Info is ",
                                      kTimestampThenLog),
    recordHandler<KCellularGmmContext>(D::GMMContext, "Received GMM Context Info is ",
                                       kTimestampThenLog),
    recordHandler<KCellularEmmContext>(D::LTEEMMContext, "Received EMM Context is ",
                                       kEmmContextSteps),
    recordHandler<KCellularActivatedBearerContexts>(
        D::CellularActiveBearer, "Received Bearer Context Info is ", kActiveBearerSteps),
    recordHandler<KCellularSimCardFiles>(D::SIMFileInfo, "Received SIM Card File Info is ",
                                         kSimFileSteps),
};

}  // namespace

std::span<const Handler> gsmNasHandlers() {
  return kGsmNasHandlers;
}

}  // namespace store
