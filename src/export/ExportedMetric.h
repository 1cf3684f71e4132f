#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

#include "export/MetricCatalog.h"
#include "platform/Value.h"

namespace exporting {

// The key of a metric log line that names the device the metric came from, where known.
inline constexpr std::string_view kDeviceKey = "device";

// One metric of a log, as every export format sees it. Borrows from the log entry.
struct ExportedMetric {
  std::uint32_t metricID;
  const platform::Bytes* payload;
  std::optional<KnownMetric> known;  // empty for a metric ID no schema declares
  // Milliseconds since 1970-01-01 UTC: the record's timestamp, else the log's "t_ms".
  std::int64_t timeMs;
  std::optional<std::int64_t> deliveryMs;  // "t_ms"
  std::string_view device;                 // empty when not known
};

// Gives each metric of a log its time. A metric with neither a record timestamp nor "t_ms"
// takes the time of the metric before it, so that times never go back for want of one.
class MetricTimes {
 public:
  // The metric of a metric record (a log entry's, or one delivered live), or what keeps it from
  // being exported: no integer "kKeyMetricID" of 32 bits, or no byte "kKeyPayload". The metric
  // borrows from `record`.
  std::variant<ExportedMetric, std::string> metricOf(const platform::Dictionary& record,
                                                     std::optional<std::int64_t> deliveryMs);

 private:
  std::int64_t previousMs_ = 0;
};

}  // namespace exporting
