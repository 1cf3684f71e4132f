#include "events/EventDetector.h"

#include <memory>
#include <span>
#include <unordered_map>

#include "store/MetricValidator.h"

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

using platform::Dictionary;
using platform::Value;

// The elements of a list cut to the keys a field watches; Null for an element that is no
// dictionary.
Value cutElements(const List& list, std::span<const std::string_view> keys) {
  List cut;
  cut.reserve(list.size());
  for (const Value& element : list) {
    const Dictionary* entries = element.asDictionary();
    if (entries == nullptr) {
      cut.emplace_back();
      continue;
    }
    Dictionary kept;
    for (const std::string_view key : keys) {
      if (const Value* value = entries->find(key)) kept.append(std::string(key), *value);
    }
    cut.emplace_back(std::move(kept));
  }
  return cut;
}

Value watchedField(const Field& field, const Dictionary& decoded) {
  const Value* found = decoded.find(field.key);
  if (found == nullptr) return Value();
  if (!field.elementKeys.empty() && found->isList())
    return cutElements(*found->asList(), field.elementKeys);
  return *found;
}

List watchedValue(const Detector& detector, const Dictionary& decoded) {
  List value;
  value.reserve(detector.fields.size() + 1);
  value.emplace_back(detector.label);
  for (const Field& field : detector.fields)
    value.push_back(watchedField(field, decoded));
  return value;
}

// Whether a list holds, element by element, what its cut remembered; compared in place, since
// most metrics change nothing a detector watches.
bool sameElements(const List& list, const List& cut, std::span<const std::string_view> keys) {
  if (list.size() != cut.size()) return false;
  for (std::size_t i = 0; i < list.size(); ++i) {
    const Dictionary* now = list[i].asDictionary();
    const Dictionary* then = cut[i].asDictionary();
    if (now == nullptr || then == nullptr) {
      if (now != nullptr || then != nullptr) return false;
      continue;
    }
    std::size_t present = 0;
    for (const std::string_view key : keys) {
      const Value* value = now->find(key);
      if (value == nullptr) continue;
      ++present;
      const Value* remembered = then->find(key);
      if (remembered == nullptr || !(*remembered == *value)) return false;
    }
    if (present != then->size()) return false;
  }
  return true;
}

bool unchanged(const List& remembered, const Detector& detector, const Dictionary& decoded) {
  if (remembered.size() != detector.fields.size() + 1 || !remembered[0].isString() ||
      *remembered[0].asString() != detector.label)
    return false;
  for (std::size_t i = 0; i < detector.fields.size(); ++i) {
    const Field& field = detector.fields[i];
    const Value& then = remembered[i + 1];
    const Value* now = decoded.find(field.key);
    if (now == nullptr) {
      if (!then.isNull()) return false;
    } else if (!field.elementKeys.empty() && now->isList() && then.isList()) {
      if (!sameElements(*now->asList(), *then.asList(), field.elementKeys)) return false;
    } else if (!(then == *now)) {
      return false;
    }
  }
  return true;
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
    const bool changed = !remembered || !unchanged(*remembered, *detector, decoded);
    const bool describe = detector->when == When::Every ||
                          (changed && (remembered || detector->when == When::FirstOrChanged));
    if (!describe && !changed) continue;
    List after = watchedValue(*detector, decoded);
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

void EventDetector::watch(store::MetricValidator& intake) {
  intake.addAcceptedMetricObserver(
      [this](std::int64_t id, const platform::Bytes* payload, const platform::Dictionary& decoded) {
        observe(id, payload, decoded);
      });
}

void EventDetector::reset() {
  memory_ = Memory{};
  lastTimeMs_ = 0;
}

}  // namespace events
