#include "store/StoreDump.h"

namespace store {

namespace {

using platform::Dictionary;
using platform::Value;

Value valueOf(const std::optional<Dictionary>& dictionary) {
  return dictionary ? Value(*dictionary) : Value();
}

Dictionary fieldsOf(const LTE& lte) {
  return {{"SelReselCellInfo", lte.SelReselCellInfo},
          {"EutraNbrs", lte.EutraNbrs},
          {"RsrpRsrqSinr", lte.RsrpRsrqSinr},
          {"TxPower", lte.TxPower},
          {"EutraNbrsMeas", lte.EutraNbrsMeas},
          {"UtraNbrsMeas", lte.UtraNbrsMeas},
          {"GeraNbrsMeas", lte.GeraNbrsMeas},
          {"CAStatusList", lte.CAStatusList},
          {"SecondaryCellMeasList", lte.SecondaryCellMeasList},
          {"MMCommonInfo", lte.MMCommonInfo},
          {"IMSI", lte.IMSI}};
}

Dictionary fieldsOf(const UMTS& umts) {
  return {{"rXInfo", umts.rXInfo},
          {"TxPower", umts.TxPower},
          {"SelReselCellInfo", umts.SelReselCellInfo},
          {"eUtraNbrs", umts.eUtraNbrs},
          {"utraNbrs", umts.utraNbrs},
          {"geraNbrs", umts.geraNbrs},
          {"eUtraNbrMeas", umts.eUtraNbrMeas},
          {"utraNbrMeas", umts.utraNbrMeas},
          {"geraNbrMeas", umts.geraNbrMeas}};
}

Dictionary fieldsOf(const GSM& gsm) {
  return {{"eUtraNbrMeas", gsm.eUtraNbrMeas},
          {"utraNbrMeas", gsm.utraNbrMeas},
          {"geraNbrMeas", gsm.geraNbrMeas}};
}

Dictionary fieldsOf(const Common& common) {
  return {{"activeBearer", common.activeBearer}, {"simContents", common.simContents}};
}

}  // namespace

Dictionary dumpStore(const MetricValidator& validator) {
  Dictionary dump;
  dump.append("metricID", validator.metricID() ? Value(*validator.metricID()) : Value());
  for (std::size_t i = 0; i < kDisplayDictionaryCount; ++i) {
    const auto which = static_cast<DisplayDictionary>(i);
    dump.append(std::string(memberName(which)), valueOf(validator.displayDictionary(which)));
  }
  dump.append("myLTE", fieldsOf(validator.myLTE()));
  dump.append("myUMTS", fieldsOf(validator.myUMTS()));
  dump.append("myGSM", fieldsOf(validator.myGSM()));
  dump.append("myCommon", fieldsOf(validator.myCommon()));
  return dump;
}

}  // namespace store
