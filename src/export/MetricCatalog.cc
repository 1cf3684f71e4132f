#include "export/MetricCatalog.h"

#include <algorithm>
#include <vector>

#include "codec/Codable.h"
#include "codec/Reader.h"
#include "messages/Metrics.h"

namespace exporting {

namespace {

constexpr std::uint64_t kTimestampField = 1;

std::vector<KnownMetric> byMetricID() {
  std::vector<KnownMetric> metrics;
  metrics.reserve(messages::kMetricKinds.size());
  for (const messages::MetricKind& kind : messages::kMetricKinds) {
    metrics.push_back(
        {&kind, kind.recordClass.empty() ? nullptr : messages::recordClassNamed(kind.recordClass)});
  }
  std::ranges::sort(metrics, {}, [](const KnownMetric& metric) { return metric.kind->metricID; });
  return metrics;
}

}  // namespace

std::optional<KnownMetric> knownMetric(std::uint32_t metricID) {
  static const std::vector<KnownMetric> metrics = byMetricID();
  const auto found = std::ranges::lower_bound(
      metrics, metricID, {}, [](const KnownMetric& metric) { return metric.kind->metricID; });
  if (found == metrics.end() || found->kind->metricID != metricID) return std::nullopt;
  return *found;
}

std::optional<std::uint64_t> recordTimestamp(const platform::Bytes& payload,
                                             const messages::RecordClass& record) {
  // Records that apply the metric-ID tag rule read field numbers in 16 bits.
  const std::uint64_t fieldMask = record.appliesMetricIdTagRule ? 0xFFFF : 0xFFFFFFFF;
  codec::Reader reader(payload);
  std::optional<std::uint64_t> timestamp;
  while (reader.position() < reader.length()) {
    const std::uint64_t key = reader.readVarint();
    const auto wireType = static_cast<std::uint32_t>(key & 7);
    if (reader.hasError() || wireType == codec::kWireEndGroup) break;
    const auto field = static_cast<std::uint32_t>((key >> 3) & fieldMask);
    if (field == kTimestampField) {
      const std::uint64_t value = reader.readVarint();
      if (reader.hasError()) break;
      timestamp = value;
    } else if (!reader.skip(field, wireType)) {
      break;
    }
  }
  return timestamp;
}

std::optional<platform::Dictionary> decodeRecord(const platform::Bytes& payload,
                                                 const messages::RecordClass& record) {
  const std::shared_ptr<codec::Codable> decoded = record.create();
  codec::Reader reader(payload);
  if (!decoded->readFrom(reader)) return std::nullopt;
  return decoded->dictionaryRepresentation();
}

}  // namespace exporting
