#include "export/ExportedMetric.h"

#include <limits>

#include "tarn/Names.h"

namespace exporting {

std::variant<ExportedMetric, std::string> MetricTimes::metricOf(
    const platform::Dictionary& record, std::optional<std::int64_t> deliveryMs) {
  const platform::Value* id = record.find(tarn::kKeyMetricID);
  const std::optional<std::int64_t> metricID = id != nullptr ? id->asInteger() : std::nullopt;
  if (!metricID || *metricID < 0 || *metricID > std::numeric_limits<std::uint32_t>::max())
    return std::string("no \"kKeyMetricID\" that is a whole number of 32 bits");
  const platform::Value* payload = record.find(tarn::kKeyPayload);
  if (payload == nullptr || !payload->isBytes()) return std::string("no \"kKeyPayload\"");

  ExportedMetric metric{.metricID = static_cast<std::uint32_t>(*metricID),
                        .payload = payload->asBytes(),
                        .known = knownMetric(static_cast<std::uint32_t>(*metricID)),
                        .timeMs = previousMs_,
                        .deliveryMs = deliveryMs,
                        .device = {}};
  std::optional<std::uint64_t> timestamp;
  if (metric.known && metric.known->record != nullptr)
    timestamp = recordTimestamp(*metric.payload, *metric.known->record);
  if (timestamp && *timestamp <= std::uint64_t{std::numeric_limits<std::int64_t>::max()}) {
    metric.timeMs = static_cast<std::int64_t>(*timestamp);
  } else if (deliveryMs) {
    metric.timeMs = *deliveryMs;
  }
  previousMs_ = metric.timeMs;
  if (const platform::Value* device = record.find(kDeviceKey)) {
    if (const std::string* name = device->asString()) metric.device = *name;
  }
  return metric;
}

}  // namespace exporting
