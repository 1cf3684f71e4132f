#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "platform/Value.h"

// What happened, and when: one change that matters to an engineer, found in the metrics the
// intake accepts.
namespace events {

enum class Severity { Info, Warning, Failure };

// "info", "warning", "failure".
std::string_view severityName(Severity severity);
std::optional<Severity> severityNamed(std::string_view name);

// The kinds of event, as the API and the timeline name them.
namespace kind {
inline constexpr std::string_view kRrc = "rrc";
inline constexpr std::string_view kRadioLink = "radio-link";
inline constexpr std::string_view kHandover = "handover";
inline constexpr std::string_view kReselection = "reselection";
inline constexpr std::string_view kTechnology = "technology";
inline constexpr std::string_view kRegistration = "registration";
inline constexpr std::string_view kReject = "reject";
inline constexpr std::string_view kCarrier = "carrier";
inline constexpr std::string_view kBearer = "bearer";
inline constexpr std::string_view kArea = "area";
inline constexpr std::string_view kSim = "sim";
inline constexpr std::string_view kAlert = "alert";
inline constexpr std::string_view kAll[] = {kRrc,        kRadioLink,    kHandover, kReselection,
                                            kTechnology, kRegistration, kReject,   kCarrier,
                                            kBearer,     kArea,         kSim,      kAlert};
}  // namespace kind

// The kind of that name, as one of kind::kAll, or nothing.
std::optional<std::string_view> kindNamed(std::string_view name);

// The metric behind an event: its ID and payload, kept so that it can be decoded again when
// someone asks. Events found in one metric share it.
struct SourceMetric {
  // Records that events come from are far smaller; a larger payload is not kept, which bounds
  // the memory of a full ring.
  static constexpr std::size_t kMaxKeptBytes = 1024;

  std::int64_t metricID = 0;
  platform::Bytes payload;
  bool kept = false;  // whether the payload is here
};

struct Event {
  std::uint64_t id = 0;     // counts up from 1 within one ring, never reused
  std::int64_t timeMs = 0;  // the record's timestamp, milliseconds since 1970
  std::string_view kind;    // one of kind::
  Severity severity = Severity::Info;
  std::string text;                            // one line
  std::shared_ptr<const SourceMetric> metric;  // none for alerts
};

}  // namespace events
