#include "export/testing/SimulatedDrive.h"

#include "export/ExportedMetric.h"
#include "tarn/Names.h"
#include "tarn/log/MetricLog.h"
#include "tarn/sim/Simulator.h"

namespace exporting::testing {

std::string simulatedDriveLog(std::uint64_t seed, std::uint64_t durationMs,
                              const std::string& device) {
  tarn::sim::Simulator simulator(seed, kDriveStartEpochMs);
  std::string log;
  const auto append = [&](const tarn::service::Metric& metric, std::uint64_t atMs) {
    platform::Dictionary record{{std::string(tarn::kKeyMetricID), std::int64_t{metric.metricId}},
                                {std::string(tarn::kKeyPayload), metric.payload},
                                {std::string(tarn::kKeyProfileID), std::int64_t{0}},
                                {std::string(tarn::kKeyAppID), std::int64_t{2}}};
    std::string line = *tarn::log::formatMetricLogLine(
        record, static_cast<std::int64_t>(atMs - kDriveStartEpochMs));
    // The log writer keeps only the session's keys; the device comes from where the log is
    // made, so it is added to the line here as such a recorder would.
    line.insert(line.size() - 1, ",\"" + std::string(kDeviceKey) + "\":\"" + device + "\"");
    log += line;
    log += '\n';
  };
  append(simulator.simFiles(), kDriveStartEpochMs);
  for (const tarn::sim::TimedMetric& timed : simulator.advance(durationMs))
    append(timed.metric, timed.atMs);
  return log;
}

}  // namespace exporting::testing
