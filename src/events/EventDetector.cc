#include "events/EventDetector.h"

#include <memory>
#include <span>
#include <unordered_map>

namespace events {

namespace {

using platform::List;

// The detectors of each metric ID, in table order.
const std::unordered_map<std::int64_t, std::vector<const Detector*>>& detectorsByMetricID() {
  static const auto* const byID = [] {
    auto* table = new std::unordered_map<std::int64_t, std::vector<const Detector*>>;
    for (const Detector& detector : detectors())
      (*table)[detector.metricID].push_back(&detector);
    return table;
  }();
  return *byID;
}

List watchedValue(const Detector& detector, const platform::Dictionary& decoded) {
  List value;
  value.reserve(detector.fields.size() + 1);
  value.emplace_back(detector.label);
  for (const Field& field : detector.fields) {
    const platform::Value* found = decoded.find(field.key);
    value.push_back(found != nullptr ? *found : platform::Value());
  }
  return value;
}

}  // namespace

void EventDetector::observe(std::int64_t metricID, const platform::Bytes* payload,
                            const platform::Dictionary& decoded) {
  const auto& byID = detectorsByMetricID();
  const auto found = byID.find(metricID);
  if (found == byID.end()) return;

  const platform::Value* timestamp = decoded.find("timestamp");
  if (const auto ms = timestamp != nullptr ? timestamp->asInteger() : std::nullopt)
    lastTimeMs_ = *ms;

  drafts_.clear();
  for (const Detector* detector : found->second) {
    std::optional<List>& remembered = memory_[static_cast<std::size_t>(detector->subject)];
    List after = watchedValue(*detector, decoded);
    const bool changed = !remembered || *remembered != after;
    const bool describe = detector->when == When::Every ||
                          (changed && (remembered || detector->when == When::FirstOrChanged));
    if (describe) {
      detector->describe(
          Change{*detector, remembered ? &*remembered : nullptr, after, decoded, memory_}, drafts_);
    }
    if (changed) remembered = std::move(after);
  }
  if (drafts_.empty()) return;

  auto metric = std::make_shared<SourceMetric>();
  metric->metricID = metricID;
  if (payload != nullptr && payload->size() <= SourceMetric::kMaxKeptBytes) {
    metric->payload = *payload;
    metric->kept = true;
  }
  for (Draft& draft : drafts_) {
    Event event;
    event.timeMs = lastTimeMs_;
    event.kind = draft.kind;
    event.severity = draft.severity;
    event.text = std::move(draft.text);
    event.metric = metric;
    ring_.add(std::move(event));
  }
}

void EventDetector::reset() {
  memory_ = Memory{};
  lastTimeMs_ = 0;
}

}  // namespace events
