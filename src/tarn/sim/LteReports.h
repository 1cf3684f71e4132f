#pragma once

#include "tarn/sim/Report.h"

// The LTE metrics, encoded as the baseband sends them.
namespace tarn::sim::lte_reports {

service::Metric rrcState(const ReportContext& context);
service::Metric cdrxConfig(const ReportContext& context);
// A record the intake does not decode: the time of the failure, its cause (0 = T310 expiry),
// and the cell it happened on.
service::Metric radioLinkFailure(const ReportContext& context);
service::Metric servingCellInfo(const ReportContext& context);
service::Metric selReselInfo(const ReportContext& context);
service::Metric servingCellMeasurement(const ReportContext& context);
service::Metric txPower(const ReportContext& context);
service::Metric rsrpRsrqSinr(const ReportContext& context);
service::Metric componentCarriers(const ReportContext& context);
service::Metric carrierAggregationStatus(const ReportContext& context);
service::Metric secondaryCellMeasurement(const ReportContext& context);
service::Metric neighbourMeasurement(const ReportContext& context);
service::Metric interRatMeasurement(const ReportContext& context);

}  // namespace tarn::sim::lte_reports
