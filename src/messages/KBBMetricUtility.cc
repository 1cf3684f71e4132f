#include "messages/KBBMetricUtility.h"

#include "platform/Log.h"

namespace messages {
namespace {

// Names as the baseband stores them: two name no record class, and the GSM
// and SIM names begin with a lower-case "k".
constexpr std::array<KBBMetricUtility::Entry, 31> kMetricIds{{
    {19972, "KCellularLteRrcState"},
    {19992, "KCellularLteCdrxConfig"},
    {20005, "KCellularLteRadioLinkFailure"},
    {16578, "KCellularLteScellInfo"},
    {54030, "KCellularLteSelReselCellInfo"},
    {54017, "KCellularLteServingCellMeasurement"},
    {54018, "KCellularLteTxPower"},
    {20330, "KCellularRsrpRsrqSinr"},
    {54540, "KCellularEmmContext"},
    {54027, "KCellularLteComponentCarrierInfo"},
    {54035, "KCellularLteCarrierAggregationStatus"},
    {54032, "KCellularLteNbrInterRatCellMeas"},
    {54031, "KCellularLteNbrEutraCellMeas"},
    {54537, "KCellularMmCommonInfo"},
    {54541, "KCellularActivatedBearerContexts"},
    {53522, "KCellularWcdmaRrcConnectionState"},
    {12300, "KCellularWcdmaCellInfo"},
    {53506, "KCellularWcdmaScellMeasurement"},
    {53507, "KCellularWcdmaTxPower"},
    {53509, "KCellularWcdmaNbrCellMeas"},
    {53508, "KCellularWcdmaSelReselCellInfo"},
    {53523, "KCellularWcdmaRrcConfiguration"},
    {54538, "KCellularMmContext"},
    {54539, "KCellularGmmContext"},
    {11788, "kCellularGsmScellInfo"},
    {53249, "kCellularGsmIdleConfig"},
    {53250, "kCellularGsmIdleScellMeasurement"},
    {53251, "kCellularGsmCsRfMeasurement"},
    {53257, "kCellularGsmGrrEventMeasCr"},
    {53260, "kCellularGsmGprsConfig"},
    {19, "kCellularSimCardFiles"},
}};

// The table as one bit per 16-bit tag (8 KiB), built at compile time, so the
// per-field test is a single load and never races.
constexpr std::array<std::uint64_t, 1024> tagBits() {
  std::array<std::uint64_t, 1024> bits{};
  for (const auto& entry : kMetricIds)
    bits[entry.metricId >> 6] |= 1ull << (entry.metricId & 63);
  return bits;
}

}  // namespace

const std::array<std::uint64_t, 1024> KBBMetricUtility::kTagBits = tagBits();

const std::array<KBBMetricUtility::Entry, 31>& KBBMetricUtility::metricIdTable() {
  return kMetricIds;
}

void KBBMetricUtility::logValidTag() {
  platform::log::plain("valid metricId tag");
}

}  // namespace messages
