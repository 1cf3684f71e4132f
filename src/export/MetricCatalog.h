#pragma once

#include <cstdint>
#include <optional>

#include "messages/MetricKind.h"
#include "messages/RecordClass.h"
#include "platform/Value.h"

namespace exporting {

// A metric the schemas declare, with the record class that decodes its payload (none for a
// metric no record carries).
struct KnownMetric {
  const messages::MetricKind* kind;
  const messages::RecordClass* record;
};

// Empty for a metric ID that no schema declares.
std::optional<KnownMetric> knownMetric(std::uint32_t metricID);

// The record's `timestamp` (field 1 of every metric record, milliseconds since 1970) without
// decoding the rest: a varint whatever its wire type, as the record reads it, the last one
// counting; other fields are skipped as their wire type frames them. Empty when the payload has
// none or breaks off before it.
std::optional<std::uint64_t> recordTimestamp(const platform::Bytes& payload,
                                             const messages::RecordClass& record);

// The record's dictionary (field names to values, enumerations by name), as the intake takes
// it; empty when the payload does not decode cleanly with the record class.
std::optional<platform::Dictionary> decodeRecord(const platform::Bytes& payload,
                                                 const messages::RecordClass& record);

}  // namespace exporting
