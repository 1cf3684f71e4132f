#include "events/EventJson.h"

#include "platform/DateFormat.h"
#include "platform/Format.h"

namespace events {

namespace {

constexpr std::string_view kTimePattern = "yyyy-MM-dd HH:mm:ss.SSS zzz";

}  // namespace

platform::Dictionary eventDictionary(const Event& event) {
  platform::Dictionary dictionary;
  dictionary.reserve(6);
  dictionary.append("id", event.id);
  dictionary.append("time_ms", event.timeMs);
  dictionary.append("kind", event.kind);
  dictionary.append("severity", severityName(event.severity));
  dictionary.append("text", event.text);
  dictionary.append("metric_id",
                    event.metric ? platform::Value(event.metric->metricID) : platform::Value());
  return dictionary;
}

std::optional<std::string> eventTimeText(const Event& event) {
  return platform::formatDate(static_cast<double>(event.timeMs), kTimePattern);
}

std::string eventLine(const Event& event) {
  const std::optional<std::string> time = eventTimeText(event);
  return platform::format("%s  %-7s  %-12s  %s", time ? *time : std::to_string(event.timeMs),
                          std::string(severityName(event.severity)), std::string(event.kind),
                          event.text);
}

}  // namespace events
