#pragma once

#include "tarn/sim/Report.h"

// The UMTS metrics, encoded as the baseband sends them.
namespace tarn::sim::umts_reports {

service::Metric rrcState(const ReportContext& context);
service::Metric rrcConfig(const ReportContext& context);
service::Metric servingCellInfo(const ReportContext& context);
// Per receive antenna: carrier RSSI in dBm, the CPICH RSCP and Ec/No as reporting indexes in
// the RSRP and RSRQ slots, and the CPICH SNR in dB.
service::Metric servingCellMeasurement(const ReportContext& context);
service::Metric txPower(const ReportContext& context);
service::Metric selReselInfo(const ReportContext& context);
service::Metric neighbourMeasurement(const ReportContext& context);

}  // namespace tarn::sim::umts_reports
