#include "tarn/flow/DropTally.h"

#include "platform/Format.h"
#include "tarn/Names.h"

namespace tarn::flow {

std::optional<std::string> DropTally::report(Clock::time_point now) {
  if (sinceReport_.empty()) return std::nullopt;
  if (lastReport_ && now - *lastReport_ < std::chrono::seconds(1)) return std::nullopt;
  std::uint64_t total = 0;
  std::string kinds;
  for (const auto& [kind, count] : sinceReport_) {
    total += count;
    if (!kinds.empty()) kinds += ", ";
    kinds += platform::format("%s \u00D7%llu", kindName(kind), count);
  }
  sinceReport_.clear();
  lastReport_ = now;
  return platform::format("%s: fell behind; dropped %llu event(s), the oldest of their kind: %s",
                          who_, total, kinds);
}

std::uint64_t kindOfEvent(std::string_view event, const ipc::Object& object) {
  if (event != kEventMetric) return 0;
  const ipc::Object* metricId = object.find(kKeyMetricID);
  const std::int64_t* value = metricId != nullptr ? metricId->asInteger() : nullptr;
  return value != nullptr && *value > 0 ? static_cast<std::uint64_t>(*value) : 0;
}

std::string kindName(std::uint64_t kind) {
  return kind == 0 ? std::string("events") : platform::format("0x%llX", kind);
}

}  // namespace tarn::flow
