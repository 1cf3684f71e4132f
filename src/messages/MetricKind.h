#pragma once

#include <cstdint>
#include <string_view>

namespace messages {

// One metric a baseband delivers, as the schemas declare it (generated into Metrics.h).
struct MetricKind {
  std::uint32_t metricID;        // 0x3C in bits 16 to 23, the metric's tag below
  std::string_view name;         // in the baseband's table of metric-ID tags
  std::string_view recordClass;  // empty when no record carries the metric
  bool tagListed;                // whether the tag is in the baseband's table of metric-ID tags
};

}  // namespace messages
