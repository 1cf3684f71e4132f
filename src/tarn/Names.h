#pragma once

#include <string_view>

// The names that clients and the baseband manager service agree on.
namespace tarn {

// Commands.
inline constexpr std::string_view kCommandAddConfiguration = "AddConfiguration";
inline constexpr std::string_view kCommandClearConfiguration = "ClearConfiguration";
inline constexpr std::string_view kCommandQueryMetric = "QueryMetric";

// Events.
inline constexpr std::string_view kEventTrigger = "TriggerEvent";
inline constexpr std::string_view kEventMetric = "MetricEvent";

// Keys of command arguments and of delivered records.
inline constexpr std::string_view kKeyAppID = "kKeyAppID";
inline constexpr std::string_view kKeyPayload = "kKeyPayload";
inline constexpr std::string_view kKeyPayloadType = "kKeyPayloadType";
inline constexpr std::string_view kKeyTriggerRef = "kKeyTriggerRef";
inline constexpr std::string_view kKeyTriggerType = "kKeyTriggerType";
inline constexpr std::string_view kKeyTriggerID = "kKeyTriggerID";
inline constexpr std::string_view kKeyProfileID = "kKeyProfileID";
inline constexpr std::string_view kKeyMetricID = "kKeyMetricID";

}  // namespace tarn
