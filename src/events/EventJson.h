#pragma once

#include <optional>
#include <string>

#include "events/Event.h"
#include "platform/Value.h"

namespace events {

// {"id": 7, "time_ms": 1718100000000, "kind": "handover", "severity": "info", "text": "...",
//  "metric_id": 3948738}; "metric_id" is null for an event with no metric behind it.
platform::Dictionary eventDictionary(const Event& event);

// The record's time as "2024-06-11 12:00:00.250 CEST", in the current time zone.
std::optional<std::string> eventTimeText(const Event& event);

// One line an engineer reads: time, severity, kind and text, aligned in columns.
std::string eventLine(const Event& event);

}  // namespace events
