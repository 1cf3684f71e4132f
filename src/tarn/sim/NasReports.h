#pragma once

#include "tarn/sim/Report.h"

// The NAS metrics: registration contexts of the three domains, common mobility information
// and the active bearers.
namespace tarn::sim::nas_reports {

service::Metric emmContext(const ReportContext& context);
service::Metric mmContext(const ReportContext& context);
service::Metric gmmContext(const ReportContext& context);
service::Metric mmCommonInfo(const ReportContext& context);
service::Metric activeBearers(const ReportContext& context);

}  // namespace tarn::sim::nas_reports
