#include "messages/KBBMetricUtility.h"

#include <algorithm>

#include "messages/Metrics.h"
#include "platform/Log.h"

namespace messages {
namespace {

// The metrics whose tags are metric-ID tags, named as the baseband's table names them: two
// name no record class, and the GSM and SIM names begin with a lower-case "k".
static_assert(std::ranges::count_if(kMetricKinds, &MetricKind::tagListed) == 31,
              "the baseband's table holds 31 metric-ID tags");

constexpr std::array<KBBMetricUtility::Entry, 31> tagTable() {
  std::array<KBBMetricUtility::Entry, 31> table{};
  auto next = table.begin();
  for (const MetricKind& metric : kMetricKinds) {
    if (metric.tagListed)
      *next++ = {static_cast<std::uint16_t>(metric.metricID & 0xFFFF), metric.name};
  }
  return table;
}

constexpr std::array<KBBMetricUtility::Entry, 31> kMetricIds = tagTable();

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
