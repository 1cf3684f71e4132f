#include "oracle/RecordOperations.h"

#include <map>

#include "messages/Records.h"

namespace oracle {
namespace {

template <class Record>
RecordOperations operationsOf() {
  return {
      [](const codec::Codable& record) -> std::shared_ptr<codec::Codable> {
        return static_cast<const Record&>(record).copyWithZone();
      },
      [](const codec::Codable& record) -> std::shared_ptr<codec::Codable> {
        auto copy = std::make_shared<Record>();
        static_cast<const Record&>(record).copyTo(*copy);
        return copy;
      },
      [](codec::Codable& record, const codec::Codable& other) {
        static_cast<Record&>(record).mergeFrom(static_cast<const Record&>(other));
      },
  };
}

template <class... Records>
std::map<std::string_view, RecordOperations, std::less<>> operationsByName() {
  return {{Records().className(), operationsOf<Records>()}...};
}

}  // namespace

const RecordOperations* recordOperationsNamed(std::string_view className) {
  using namespace messages;
  static const auto table = operationsByName<
      KCellularLteRrcState, KCellularLteCdrxConfig, KCellularLteScellInfo,
      KCellularLteServingCellMeasurement, RxInfo, KCellularLteRsrpRsrqSinr, RsrpRsrqSinr,
      KCellularLteTxPower, TxPowerInfo, KCellularLteSelReselCellInfo, NbrEutra,
      KCellularLteComponentCarrierInfo, KCellularLteCarrierAggregationStatus,
      SecondaryComponentCarrier, KCellularLteSecondaryCellMeasurements, SccRxMeasurement,
      KCellularLteNbrEutraCellMeas, EgwErrcNbrEutraMeas, KCellularLteNbrInterRatCellMeas,
      EgwErrcNbrUtraMeas, EgwErrcNbrGeranMeas, KCellularWcdmaRrcConnectionState,
      KCellularWcdmaRrcConfiguration, KCellularWcdmaCellInfo, KCellularWcdmaScellMeasurement,
      KCellularWcdmaTxPower, KCellularWcdmaNbrCellMeas, UtraCellMeasResult, GsmCellMeasResult,
      LteCellMeasResult, KCellularWcdmaSelReselCellInfo, EutraFreqInfo, UtraFreqInfo, GsmFreqInfo,
      KCellularGsmScellInfo, KCellularGsmIdleConfig, KCellularGsmIdleScellMeasurement,
      KCellularGsmCsRfMeasurement, KCellularGsmGrrEventMeasCr, GsmNcellMeas, UmtsNcellMeas,
      LteNcellMeas, KCellularGsmGprsConfig, KCellularMmCommonInfo, KCellularEmmContext,
      KCellularMmContext, KCellularGmmContext, KCellularActivatedBearerContexts, BearerContext,
      Plmn, KCellularLocationAreaId, RoutingAreaId, KCellularTrackingAreaId, Guti,
      KCellularSimCardFiles, ElementaryFile>();
  const auto found = table.find(className);
  return found == table.end() ? nullptr : &found->second;
}

}  // namespace oracle
