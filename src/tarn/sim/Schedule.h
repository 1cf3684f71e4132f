#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "tarn/sim/PhoneState.h"
#include "tarn/sim/Report.h"

// When the baseband sends which metric: measurements periodically while they apply,
// configuration and state when they change.
namespace tarn::sim::schedule {

struct Periodic {
  std::uint32_t periodMs;
  bool (*applies)(const ReportContext& context);
  ReportBuilder build;
};
std::span<const Periodic> periodicReports();

// The metrics that report `change`, in the order they are sent.
std::vector<ReportBuilder> reportsOf(Change change);

}  // namespace tarn::sim::schedule
