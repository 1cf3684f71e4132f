#include "screens/Categories.h"

#include <map>
#include <string>

namespace screens {

namespace {

using store::DisplayDictionary;
using store::MetricValidator;

constexpr std::optional<std::string_view> kNoHeader;

// The list categories read record fields; these name them.
#define NORVO_FIELD(record, field)                      \
  [](const MetricValidator& validator) -> const auto& { \
    return validator.record().field;                    \
  }

const std::map<std::string, Category, std::less<>>& categories() {
  static const std::map<std::string, Category, std::less<>> table{
      {"Device Info SIM Files",
       ListCategory{NORVO_FIELD(myCommon, simContents), "SIM Content ", true}},

      {"LTE NAS", DictionaryCategory{DisplayDictionary::LTEEMMContext}},
      {"LTE RRC State", DictionaryCategory{DisplayDictionary::LTERRCState}},
      {"LTE Serving Cell Info", DictionaryCategory{DisplayDictionary::LTESCellInfo}},
      {"LTE Serving Cell Meas", ListCategory{NORVO_FIELD(myLTE, RsrpRsrqSinr), kNoHeader, true}},
      {"LTE Tx Power", ListCategory{NORVO_FIELD(myLTE, TxPower), "TxPowerInfo "}},
      {"LTE Sel Resel Parameters", RecordDictionaryCategory{NORVO_FIELD(myLTE, SelReselCellInfo)}},
      {"LTE EUTRA Neighbor Info", ListCategory{NORVO_FIELD(myLTE, EutraNbrs), "EUTRA Neighbor "}},
      {"LTE C-DRX", DictionaryCategory{DisplayDictionary::LTECDRXConfig}},
      {"LTE LTE Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myLTE, EutraNbrsMeas), "LTE Neighbor "}},
      {"LTE UMTS Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myLTE, UtraNbrsMeas), "UMTS Neighbor "}},
      {"LTE GSM Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myLTE, GeraNbrsMeas), "GSM Neighbor "}},
      {"LTE CA Status", ListCategory{NORVO_FIELD(myLTE, CAStatusList), "Component Carrier "}},
      {"LTE Secondary Cell Meas",
       ListCategory{NORVO_FIELD(myLTE, SecondaryCellMeasList), "Secondary Cell Meas "}},
      {"LTE Active Bearers", ListCategory{NORVO_FIELD(myCommon, activeBearer), "PDP "}},

      {"UMTS NAS GMM", DictionaryCategory{DisplayDictionary::GMMContext}},
      {"UMTS NAS MM", DictionaryCategory{DisplayDictionary::MMContext}},
      {"UMTS RRC State", DictionaryCategory{DisplayDictionary::UMTSRRCState}},
      {"UMTS RRC Configuration", DictionaryCategory{DisplayDictionary::UMTSRRCConfig}},
      {"UMTS Serving Cell Info", DictionaryCategory{DisplayDictionary::UMTSCellInfo}},
      {"UMTS Serving Cell Meas", ListCategory{NORVO_FIELD(myUMTS, rXInfo), "RxInfo "}},
      {"UMTS Tx Power", ListCategory{NORVO_FIELD(myUMTS, TxPower), "TxPowerInfo "}},
      {"UMTS Sel Resel Parameters",
       RecordDictionaryCategory{NORVO_FIELD(myUMTS, SelReselCellInfo)}},
      {"UMTS EUTRA Neighbor Info", ListCategory{NORVO_FIELD(myUMTS, eUtraNbrs), "EUTRA Neighbor "}},
      {"UMTS UTRA Neighbor Info", ListCategory{NORVO_FIELD(myUMTS, utraNbrs), "UTRA Neighbor "}},
      {"UMTS GSM Neighbor Info", ListCategory{NORVO_FIELD(myUMTS, geraNbrs), "GSM Neighbor "}},
      {"UMTS LTE Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myUMTS, eUtraNbrMeas), "LTE Neighbor "}},
      {"UMTS UMTS Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myUMTS, utraNbrMeas), "UMTS Neighbor "}},
      {"UMTS GSM Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myUMTS, geraNbrMeas), "GSM Neighbor "}},
      {"UMTS Active Bearers", ListCategory{NORVO_FIELD(myCommon, activeBearer), "PDP "}},

      {"GSM NAS GMM", DictionaryCategory{DisplayDictionary::GMMContext}},
      {"GSM NAS MM", DictionaryCategory{DisplayDictionary::MMContext}},
      {"GSM Serving Cell Info", DictionaryCategory{DisplayDictionary::GSMScellInfo}},
      {"GSM Idle Config", DictionaryCategory{DisplayDictionary::GSMIdleConfigInfo}},
      {"GSM Idle Serv Cell Meas", DictionaryCategory{DisplayDictionary::GSMIdleScellMeas}},
      {"GSM Connected Serv Cell Meas", DictionaryCategory{DisplayDictionary::GSMConnRfMeas}},
      {"GSM GSM GPRS Config", DictionaryCategory{DisplayDictionary::GSMGPRSConfig}},
      {"GSM LTE Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myGSM, eUtraNbrMeas), "LTE Neighbor "}},
      {"GSM UMTS Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myGSM, utraNbrMeas), "UMTS Neighbor "}},
      {"GSM GSM Neighbor Cell Meas",
       ListCategory{NORVO_FIELD(myGSM, geraNbrMeas), "GSM Neighbor "}},
      {"GSM Active Bearers", ListCategory{NORVO_FIELD(myCommon, activeBearer), "PDP "}},
  };
  return table;
}

#undef NORVO_FIELD

}  // namespace

const Category* categoryFor(std::string_view key) {
  const auto found = categories().find(key);
  return found == categories().end() ? nullptr : &found->second;
}

}  // namespace screens
