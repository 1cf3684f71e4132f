#pragma once

#include "tarn/sim/Report.h"

// The GSM metrics, encoded as the baseband sends them. Band fields that are plain numbers
// carry the same band values as the enumerated ones (44 for E-GSM 900, 47 for DCS 1800).
namespace tarn::sim::gsm_reports {

service::Metric servingCellInfo(const ReportContext& context);
service::Metric idleConfig(const ReportContext& context);
// Layer 1 state 1 while idle, 2 while transferring packet data.
service::Metric idleServingMeasurement(const ReportContext& context);
// Layer 1 state 3 (dedicated); transmit powers in dBm, RXLEV and RXQUAL as reporting values.
service::Metric csRfMeasurement(const ReportContext& context);
service::Metric neighbourMeasurement(const ReportContext& context);
service::Metric gprsConfig(const ReportContext& context);

}  // namespace tarn::sim::gsm_reports
